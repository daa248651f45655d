// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

#include "Core.h"

namespace Lumod {

/// Writes what the daemon holds in memory into the log, whatever its level: one line an object, the word "dump" and a
/// JSON object whose member "object" says what it is.
void dumpObjects(Core &core, std::string_view trace);

} // namespace Lumod
