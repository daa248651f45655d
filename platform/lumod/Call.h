// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include <kj/time.h>

namespace Lumod {

/// What goes with everything that is done for one request, or for the daemon itself.
struct Call {
    std::string trace; ///< names the command in every log line; "-": the daemon's own doing
    kj::TimePoint deadline;
    bool ordered = true; ///< mutations of volumes wait for their turn
};

/// Shared by the promises that serve the request.
using CallPtr = std::shared_ptr<Call const>;

} // namespace Lumod
