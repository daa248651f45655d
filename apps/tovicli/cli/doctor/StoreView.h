// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "doctor/Report.h"
#include "store/HostStore.h"

namespace Tovicli::Cli {

/// What the host's store says.
struct StoreView {
    std::vector<Store::Provider> providers;
    std::vector<Store::FileSystem> fileSystems;
    std::vector<Store::Volume> volumes;
    std::vector<std::string> outages;
};

/// Checks the store's file and reads it. Whoever opens a store that a killed process left in the middle of a
/// transaction undoes that transaction; so such a store is copied elsewhere and the copy is read.
/// @return nothing when it cannot be read; a store that does not exist yet reads as an empty one
std::optional<StoreView> checkStore(std::string const &root, std::chrono::milliseconds patience, Report &report);

} // namespace Tovicli::Cli
