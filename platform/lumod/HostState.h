// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <kj/timer.h>

#include "Async.h"
#include "Call.h"
#include "lumod/Log.h"
#include "store/HostStore.h"

namespace Lumod {

/// What the host store said when it was last read.
struct HostSnapshot {
    std::vector<Store::Provider> providers;
    std::set<std::string, std::less<>> endpointOutages;
    std::optional<std::string> orkaContext;
};

/// The host store as the daemon sees it: looked at when a request comes, read again when it has changed, never waited
/// for. While another process holds its lock the last known state counts; when there is none yet, the request tries
/// again until its deadline.
class HostState {
public:
    /// Told about every snapshot before anybody works with it.
    using Listener = std::function<void(HostSnapshot const &)>;

    HostState(std::string const &root, kj::Timer &timer, Log &log, Listener listener);

    /// Failures: what the store says of its file, with path and reason.
    Answer<std::shared_ptr<HostSnapshot const>> current(CallPtr const &call);

    /// What was read last; empty when nothing was.
    std::shared_ptr<HostSnapshot const> lastKnown() const {
        return snapshot_;
    }

private:
    void read(CallPtr const &call);
    void logOnce(CallPtr const &call, LogLevel level, std::string const &sentence);

    Store::HostStore store_;
    kj::Timer &timer_;
    Log &log_;
    Listener listener_;
    std::shared_ptr<HostSnapshot const> snapshot_;
    int64_t version_ = 0;
    std::string lastSentence_;
};

} // namespace Lumod
