// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "doctor/Report.h"
#include "doctor/StoreView.h"

namespace Tovicli::Cli {

/// @return whether there is a root to look further into
bool checkRoot(std::string const &root, Report &report);

/// Holds what is mounted against what the store says: directories that are missing, and directories without a record.
void checkMounts(std::string const &root, StoreView const &view, Report &report);

} // namespace Tovicli::Cli
