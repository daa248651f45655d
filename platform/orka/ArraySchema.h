// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "sqlite/Database.h"

namespace Orka {

/// The identity and the layout of an array file.
Sqlite::Identity const &arrayFileIdentity();

} // namespace Orka
