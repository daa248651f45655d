// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orka/Topology.h"
#include "sqlite/Database.h"

namespace Orka {

/// Fills an empty array file in one transaction. Throws Sqlite::Error.
void insertTopology(Sqlite::Database &database, Topology const &topology);

} // namespace Orka
