// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "plugins/Inspection.h"

namespace Tovicli::Cli {

/// Loads and registers a plug-in as the tool would, in a process of its own that ends with it.
std::vector<Finding> tryOut(Question const &question);

} // namespace Tovicli::Cli
