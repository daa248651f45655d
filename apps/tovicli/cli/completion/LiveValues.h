// SPDX-License-Identifier: Apache-2.0
//
// Names that the host's store and its daemon know, for whoever completes a word. Nothing is changed, nothing fails:
// what cannot be had in time is not offered. A store with an unfinished transaction is not even opened, since whoever
// opens it would finish it.
#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "completion/ValueSource.h"

namespace Tovicli::Cli {

struct Candidate {
    std::string value;
    std::string description = {};
};

/// What is asked for, and what the command line says already that narrows it.
struct LiveQuery {
    Live live = Live::Providers;
    std::string root;
    std::string containerId = {}; ///< as typed; empty when none was given
    bool offline = false;
    /// For each question to the daemon; there are at most two.
    std::chrono::milliseconds patience{350};
};

std::vector<Candidate> liveValues(LiveQuery const &query);

} // namespace Tovicli::Cli
