// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <set>
#include <string>

#include "doctor/Report.h"

namespace Tovicli::Cli {

struct DaemonQuestion {
    std::string root;
    std::chrono::milliseconds timeout;
    std::string toolVersion;
    bool offline = false;
    /// Nobody else in the process has a session: the two questions can share one timeout.
    bool isOwnProcess = true;
};

/// What the daemon serves, told by the URL of the provider that serves it.
struct Served {
    std::map<std::string, std::set<std::string>> containersByUrl; ///< ids
    std::map<std::string, std::set<std::string>> arraysByUrl;
    std::set<std::string> containers;
};

/// Sockets, rights, the daemon's own word about itself, and what it serves. Only reads are asked for.
/// @return nothing when there is no daemon that answers
std::optional<Served> checkDaemon(DaemonQuestion const &question, Report &report);

} // namespace Tovicli::Cli
