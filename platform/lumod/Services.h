// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <kj/async.h>
#include <kj/timer.h>

#include "FaultRules.h"
#include "HostState.h"
#include "Outages.h"
#include "ProviderSet.h"
#include "lumod/Log.h"

namespace Lumod {

/// What every part of the daemon works with. The daemon owns it, and it outlives every promise.
struct Services {
    kj::Timer &timer;
    Log &log;
    std::function<std::string()> newKey; ///< for idempotency keys
    kj::TaskSet &tasks;                  ///< what runs by itself; failures are logged
    HostState &host;
    ProviderSet &providers;
    FaultRules &faults;
    Outages &outages;
    bool modifiesProfiles = true; ///< space-efficiency manipulation
};

} // namespace Lumod
