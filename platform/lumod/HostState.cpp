// SPDX-License-Identifier: Apache-2.0
#include "HostState.h"

#include <utility>

#include <fmt/format.h>

namespace Lumod {

namespace {

constexpr kj::Duration retryPause = 20 * kj::MILLISECONDS;

} // namespace

HostState::HostState(std::string const &root, kj::Timer &timer, Log &log, Listener listener)
    : store_(root, Store::HostStore::Mode::QueryOnly, std::chrono::milliseconds{0})
    , timer_(timer)
    , log_(log)
    , listener_(std::move(listener)) {}

Answer<std::shared_ptr<HostSnapshot const>> HostState::current(CallPtr const &call) {
    try {
        read(call);
        lastSentence_.clear();
        return Outcome(snapshot_);
    } catch (Wire::Failure const &failure) {
        if (failure.code() != Wire::ErrorCode::FileBusy) {
            logOnce(call, LogLevel::Error, failure.sentence());
            return Outcome<std::shared_ptr<HostSnapshot const>>(failure);
        }
        if (snapshot_) {
            log_.write(LogLevel::Verbose, call->trace, failure.sentence() + "; the last known state counts");
            return Outcome(snapshot_);
        }
        if (timer_.now() >= call->deadline) {
            return Outcome<std::shared_ptr<HostSnapshot const>>(failure);
        }
        logOnce(call, LogLevel::Warning, failure.sentence());
    }
    return timer_.afterDelay(retryPause).then([this, call] { return current(call); });
}

void HostState::read(CallPtr const &call) {
    // The version first: what is committed while we read shows as another change next time.
    int64_t const version = store_.dataVersion();
    if (snapshot_ && version == version_) {
        return;
    }
    auto next = std::make_shared<HostSnapshot>();
    next->providers = store_.providers();
    for (std::string &uid : store_.endpointOutages()) {
        next->endpointOutages.insert(std::move(uid));
    }
    next->orkaContext = store_.orkaContext();
    log_.write(LogLevel::Verbose, call->trace,
               fmt::format("read the host store: {} providers, {} endpoint outages", next->providers.size(),
                           next->endpointOutages.size()));
    listener_(*next);
    snapshot_ = std::move(next);
    version_ = version;
}

void HostState::logOnce(CallPtr const &call, LogLevel level, std::string const &sentence) {
    // A client that asks again and again would fill the log with the same line.
    if (sentence != lastSentence_) {
        log_.write(level, call->trace, sentence);
        lastSentence_ = sentence;
    }
}

} // namespace Lumod
