// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Tovicli {

/// What a user can do about a failure of a platform library, in a few words; empty where nothing holds in every case.
/// @param root      the host's directory
/// @param requestId of this run, as it stands in the daemon's log
std::string hintFor(int32_t code, std::string const &root, std::string const &requestId);

} // namespace Tovicli
