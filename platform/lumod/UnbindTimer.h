// SPDX-License-Identifier: Apache-2.0
//
// Unbinding takes place later: a volume that is unmounted now is often mounted again soon. Volumes wait here for their
// period to pass, and are unbound then; asked to, all of them are unbound at once. A volume that could not be unbound
// waits for another period. A restart forgets who waits; such a volume stays bound until it is mounted again, unmounted
// or deleted.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <kj/async.h>
#include <kj/timer.h>

#include "Async.h"
#include "Call.h"

namespace Lumod {

class UnbindTimer {
public:
    /// Unbinds one volume on its array; success when there is nothing to unbind any more.
    using Unbind = std::function<Answer<Done>(CallPtr const &, std::string containerId, std::string uuid)>;

    struct Waiting {
        std::string containerId;
        kj::TimePoint since;
    };

    /// @param tasks runs what nobody waits for; gone before this is
    UnbindTimer(kj::Timer &timer, kj::TaskSet &tasks, kj::Duration period, Unbind unbind);

    /// Lets a volume wait.
    void defer(std::string const &containerId, std::string const &uuid);
    /// The volume is going to be used, or deleted: it waits no longer. Wait for the promise; it resolves when nothing
    /// is unbinding the volume.
    kj::Promise<void> cancel(std::string const &uuid);
    /// How many unbindings have ended. Who read a volume's binding before the number changed may have read an old one.
    uint64_t ended() const {
        return ended_;
    }
    /// Unbinds all that wait. The unbinding goes on when the promise is dropped. Failures: of the first that failed.
    Answer<Done> unbindAll(CallPtr const &call);

    kj::Duration period() const {
        return period_;
    }
    /// Counts for those that wait already, from when they began to.
    void setPeriod(kj::Duration period);

    std::map<std::string, Waiting> const &waiting() const {
        return waiting_;
    }

private:
    /// Volumes of one container that are unbound one after the other.
    struct Batch {
        std::string containerId;
        std::vector<std::string> uuids;
    };

    void arm();
    void unbindDue();
    Answer<Done> unbindThese(CallPtr const &call, std::vector<std::string> const &uuids);
    Answer<Done> unbindBatch(CallPtr const &call, std::shared_ptr<Batch const> batch, std::size_t at,
                             std::optional<Wire::Failure> failure);
    Answer<Done> unbindOne(CallPtr const &call, std::string const &containerId, std::string const &uuid);
    CallPtr ownCall() const;

    kj::Timer &timer_;
    kj::TaskSet &tasks_;
    kj::Duration period_;
    Unbind unbind_;
    std::map<std::string, Waiting> waiting_;
    std::map<std::string, kj::ForkedPromise<void>> inProgress_;
    std::optional<kj::TimePoint> armedFor_;
    uint64_t ended_ = 0;
    kj::Promise<void> armed_ = kj::READY_NOW;
};

} // namespace Lumod
