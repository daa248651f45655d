// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "plugins/Inspection.h"

namespace Tovicli::Cli {

/// Loads and registers a plug-in as the tool would, in a process of its own that ends with it.
/// @param plugin the file, which nothing speaks against
std::vector<Finding> tryOut(Question const &question, Descriptor const &plugin);

} // namespace Tovicli::Cli
