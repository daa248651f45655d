// SPDX-License-Identifier: Apache-2.0
//
// What a service manager and the daemon say to each other, through the environment: sockets that are passed on
// (LISTEN_FDS), and when the daemon is ready (NOTIFY_SOCKET). The protocol is two datagrams and two variables, so it
// is spoken here by hand. Without a service manager nothing happens.
#pragma once

#include <optional>
#include <string>

#include "wire/Paths.h"
#include "wire/UniqueFd.h"

namespace Lumod {

/// Sockets that are bound to the root's paths and listen already.
struct PassedSockets {
    Wire::UniqueFd ordered;
    Wire::UniqueFd priority;
};

/// Takes over what was passed, and clears the variables, so that no child believes it was meant.
/// @throws Wire::Failure InvalidArgument for a descriptor that is no listening socket of the root
PassedSockets takePassedSockets(Wire::Paths const &paths);

/// Tells the service manager; silently nothing when there is none.
void notifyServiceManager(std::string const &state);

} // namespace Lumod
