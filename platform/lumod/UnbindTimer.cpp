// SPDX-License-Identifier: Apache-2.0
#include "UnbindTimer.h"

#include <algorithm>
#include <utility>

#include "JoinAll.h"

namespace Lumod {

namespace {

/// How long the daemon itself waits for a provider.
constexpr kj::Duration ownPatience = 30 * kj::SECONDS;

} // namespace

UnbindTimer::UnbindTimer(kj::Timer &timer, kj::TaskSet &tasks, kj::Duration period, Unbind unbind)
    : timer_(timer)
    , tasks_(tasks)
    , period_(period)
    , unbind_(std::move(unbind)) {}

CallPtr UnbindTimer::ownCall() const {
    return std::make_shared<Call const>(Call{"unbind-timer", timer_.now() + ownPatience, true});
}

void UnbindTimer::defer(std::string const &containerId, std::string const &uuid) {
    // Asked again, a volume goes on waiting from when it began.
    waiting_.emplace(uuid, Waiting{containerId, timer_.now()});
    arm();
}

kj::Promise<void> UnbindTimer::cancel(std::string const &uuid) {
    waiting_.erase(uuid);
    auto const running = inProgress_.find(uuid);
    return running == inProgress_.end() ? kj::Promise<void>(kj::READY_NOW) : running->second.addBranch();
}

void UnbindTimer::setPeriod(kj::Duration period) {
    period_ = period;
    armedFor_ = std::nullopt;
    arm();
}

void UnbindTimer::arm() {
    if (waiting_.empty()) {
        return;
    }
    auto const first = std::min_element(waiting_.begin(), waiting_.end(), [](auto const &left, auto const &right) {
        return left.second.since < right.second.since;
    });
    kj::TimePoint const due = first->second.since + period_;
    if (armedFor_ && *armedFor_ <= due) {
        return;
    }
    armedFor_ = due;
    // What is due runs as a task of its own, because it arms anew, and a promise must not be replaced from within.
    armed_ = timer_.atTime(due)
                 .then([this] {
                     armedFor_ = std::nullopt;
                     tasks_.add(kj::evalLater([this] { unbindDue(); }));
                 })
                 .eagerlyEvaluate(nullptr);
}

void UnbindTimer::unbindDue() {
    std::vector<std::string> due;
    for (auto const &[uuid, waiting] : waiting_) {
        if (waiting.since + period_ <= timer_.now()) {
            due.push_back(uuid);
        }
    }
    tasks_.add(unbindThese(ownCall(), due).ignoreResult());
    arm();
}

Answer<Done> UnbindTimer::unbindAll(CallPtr const &call) {
    std::vector<std::string> all;
    for (auto const &entry : waiting_) {
        all.push_back(entry.first);
    }
    auto pair = kj::newPromiseAndFulfiller<Outcome<Done>>();
    // Under the request's trace but not its deadline: half of the volumes left bound would help nobody.
    auto const own = std::make_shared<Call const>(Call{call->trace, timer_.now() + ownPatience, true});
    tasks_.add(unbindThese(own, all).then([fulfiller = kj::mv(pair.fulfiller)](Outcome<Done> &&outcome) mutable {
        fulfiller->fulfill(kj::mv(outcome));
    }));
    return kj::mv(pair.promise);
}

Answer<Done> UnbindTimer::unbindThese(CallPtr const &call, std::vector<std::string> const &uuids) {
    std::map<std::string, Batch> batches;
    for (std::string const &uuid : uuids) {
        Batch &batch = batches[waiting_.at(uuid).containerId];
        batch.containerId = waiting_.at(uuid).containerId;
        batch.uuids.push_back(uuid);
    }
    auto answers = kj::heapArrayBuilder<Answer<Done>>(batches.size());
    for (auto &entry : batches) {
        answers.add(unbindBatch(call, std::make_shared<Batch const>(std::move(entry.second)), 0, std::nullopt));
    }
    return joinAll(answers.finish()).then([](kj::Array<Outcome<Done>> &&outcomes) -> Outcome<Done> {
        for (Outcome<Done> const &outcome : outcomes) {
            if (!outcome.ok()) {
                return outcome;
            }
        }
        return Done{};
    });
}

Answer<Done> UnbindTimer::unbindBatch(CallPtr const &call, std::shared_ptr<Batch const> batch, std::size_t at,
                                      std::optional<Wire::Failure> failure) {
    if (at == batch->uuids.size()) {
        return failure ? Outcome<Done>(*std::move(failure)) : Outcome<Done>(Done{});
    }
    return whateverCame(unbindOne(call, batch->containerId, batch->uuids[at]),
                        [this, call, batch, at, failure = std::move(failure)](Outcome<Done> outcome) mutable {
                            if (!outcome.ok() && !failure) {
                                failure = outcome.failure();
                            }
                            return unbindBatch(call, batch, at + 1, std::move(failure));
                        });
}

Answer<Done> UnbindTimer::unbindOne(CallPtr const &call, std::string const &containerId, std::string const &uuid) {
    if (waiting_.erase(uuid) == 0) {
        return Outcome<Done>(Done{}); // meanwhile somebody wants it, or has deleted it
    }
    auto pair = kj::newPromiseAndFulfiller<void>();
    inProgress_.emplace(uuid, kj::mv(pair.promise).fork());
    auto finish = kj::defer([this, uuid, fulfiller = kj::mv(pair.fulfiller)]() mutable {
        ++ended_;
        inProgress_.erase(uuid);
        fulfiller->fulfill();
    });
    return whateverCame(unbind_(call, containerId, uuid),
                        [this, containerId, uuid, finish = kj::mv(finish)](Outcome<Done> outcome) mutable {
                            if (!outcome.ok()) {
                                defer(containerId, uuid);
                            }
                            return outcome;
                        });
}

} // namespace Lumod
