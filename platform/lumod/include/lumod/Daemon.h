// SPDX-License-Identifier: Apache-2.0
//
// The daemon's core without its sockets: takes a request, gives what answers it. Everything runs on the event loop of
// the thread that made it; nothing blocks but the disk. What it knows beyond the host store (activations, injected
// states, fault rules, endpoint events, volumes waiting to be unbound) is in memory, and a restart forgets it.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include <kj/async.h>
#include <kj/timer.h>

#include "lumod/Log.h"
#include "orka/Provider.h"

namespace Lumod {

/// A year. What is far longer is past the end of the daemon's clock.
constexpr int64_t longestUnbindPeriodUs = int64_t{365} * 24 * 3600 * 1000 * 1000;

struct Settings {
    std::string root;
    std::string version = "0";
    kj::Duration unbindPeriod = 5 * kj::MINUTES;
};

/// What the daemon is given from outside, so that a test can set all of it.
struct Surroundings {
    kj::Timer &timer; ///< monotonic; outlives the daemon
    Log &log;
    std::function<std::unique_ptr<Orka::Provider>(std::string const &url)> makeProvider;
    std::function<std::string()> newKey; ///< for changes on arrays: one that nobody has used before
};

struct Core;

class Daemon final {
public:
    Daemon(Settings settings, Surroundings surroundings);
    ~Daemon();
    Daemon(Daemon const &) = delete;
    Daemon &operator=(Daemon const &) = delete;

    Core &core() {
        return *core_;
    }

private:
    std::unique_ptr<Core> core_;
};

} // namespace Lumod
