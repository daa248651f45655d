// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "sqlite/Database.h"

namespace Store {

/// What makes a file a host store. A change of the layout raises the version and brings a migration.
Sqlite::Identity const &identity();

} // namespace Store
