// SPDX-License-Identifier: Apache-2.0
//
// The daemon's parts, put together. A handler finds here what it works with.
#pragma once

#include "MutationQueue.h"
#include "Services.h"
#include "Surveyor.h"
#include "UnbindTimer.h"
#include "Volumes.h"
#include "lumod/Daemon.h"

namespace Lumod {

struct Core final : private kj::TaskSet::ErrorHandler {
    Core(Settings settings, Surroundings surroundings);

    Settings settings;
    Log &log;
    kj::Timer &timer;
    kj::TimePoint started;

    FaultRules faults;
    Outages outages;
    ProviderSet providers;
    HostState host;
    Services services;
    Surveyor surveyor;
    Volumes volumes;
    MutationQueue mutations;
    UnbindTimer unbindTimer;
    /// Last, so that what runs by itself ends before the parts that it works with.
    kj::TaskSet tasks;

private:
    void taskFailed(kj::Exception &&exception) override;
    Answer<Done> unbind(CallPtr const &call, std::string const &containerId, std::string const &uuid);
};

} // namespace Lumod
