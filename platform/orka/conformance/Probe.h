// SPDX-License-Identifier: Apache-2.0
//
// What a case works with: connections to the provider under test, names that are its own, and operations that wait for
// their answers. An answer that does not come in time, or a promise that is rejected, ends the case.
#pragma once

#include <cstdint>
#include <limits>
#include <map>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "conformance/Expect.h"
#include "conformance/Ground.h"
#include "orka/conformance/Kit.h"

namespace Orka::Conformance {

inline constexpr int64_t everyVolume = std::numeric_limits<int64_t>::max();

/// An array as far as anybody can look at it from outside.
struct Snapshot {
    std::vector<StorageArray> arrays;
    std::vector<StorageContainer> containers;
    std::map<std::string, std::vector<ConfigVolume>> configVolumes; ///< by id, of the containers that cases touch
    std::vector<VirtualVolume> bound;
};

class Probe {
public:
    /// How much later than its deadline an answer may come: what a busy machine needs to turn around.
    static constexpr kj::Duration grace = 1 * kj::SECONDS;

    Probe(Surroundings const &surroundings, Ground const &ground, Snapshot const &before);

    Ground const &ground() const {
        return ground_;
    }
    std::string const &containerId() const {
        return ground_.container().id;
    }
    Surroundings const &surroundings() const {
        return surroundings_;
    }
    /// The array before the first case.
    Snapshot const &before() const {
        return before_;
    }
    Provider &provider() {
        return *provider_;
    }
    /// A connection of the caller's own.
    std::unique_ptr<Provider> connect() const {
        return surroundings_.connect();
    }
    /// Makes ready for a case.
    void begin(std::string const &caseName);
    /// Goes on with a fresh connection.
    void reconnect() {
        provider_ = connect();
    }

    /// What goes with an operation. @throws Interrupted when the run is to end: what has begun is waited for, and
    /// nothing new begins
    CallContext context(std::string key = "") const;
    CallContext within(kj::Duration time, std::string key = "") const;
    std::string freshName();
    std::string freshKey();
    /// 0 to `below` - 1, decided by the seed.
    uint32_t choose(uint32_t below);
    /// A config volume of a name that nobody has, of the array's default size.
    VolumeSpec freshSpec();

    /// Waits for an answer, until its deadline and a little longer.
    template <typename T>
    Outcome<T> ask(kj::Promise<Outcome<T>> promise, kj::TimePoint deadline);
    template <typename T>
    Outcome<T> ask(kj::Promise<Outcome<T>> promise) {
        return ask(kj::mv(promise), surroundings_.timer.now() + surroundings_.timeout);
    }
    /// Lets the event loop work for that long.
    void pass(kj::Duration time);

    // Operations through the case's connection. Those that begin with "try" give what came; the others must succeed,
    // and carry keys, so that a connection which fails now and then may be tried again.

    Outcome<VirtualVolume> tryMake(VolumeSpec const &spec, std::string const &key = "");
    Outcome<Done> tryRemove(VirtualVolume const &volume, std::string const &key = "");
    Outcome<Done> tryBind(VirtualVolume const &volume, std::string const &endpoint, std::string const &key = "");
    Outcome<Done> tryUnbind(VirtualVolume const &volume, std::string const &key = "");
    VirtualVolume make(VolumeSpec const &spec);
    VirtualVolume make() {
        return make(freshSpec());
    }
    void remove(VirtualVolume const &volume);
    void bind(VirtualVolume const &volume, std::string const &endpoint);
    void unbind(VirtualVolume const &volume);
    /// The volume as the array tells it now.
    VirtualVolume facts(VirtualVolume const &volume);
    std::vector<ConfigVolume> list(std::string const &containerId, int64_t max = everyVolume);
    std::vector<VolumePresence> presence(std::string const &containerId, std::vector<std::string> const &uuids);
    bool exists(VirtualVolume const &volume);
    std::optional<VirtualVolume> byName(std::string const &containerId, std::string const &name);
    std::vector<VirtualVolume> bound();
    /// How many config volumes of the container have that name.
    int64_t countNamed(std::string const &name);

    /// A volume that a case made in another way than through this object and that is to be removed with the rest.
    void note(VirtualVolume const &volume) {
        made_[volume.uuid] = volume.containerId;
    }
    /// Removes what the case made. @return what could not be removed, one sentence each
    std::vector<std::string> cleanUp();

private:
    template <typename T>
    struct Race {
        std::optional<Outcome<T>> outcome;
        std::string rejection;
        bool isInterrupted = false;
    };
    /// How long an operation that has begun is waited for when the run is to end.
    static constexpr kj::Duration farewell = 2 * kj::SECONDS;

    /// @return why the volume could not be removed; empty: it is gone
    std::string tryRemoveOwn(VirtualVolume const &volume);
    void removeOwn(std::string const &containerId, std::string const &uuid, std::vector<std::string> &failures);

    Surroundings const &surroundings_;
    Ground const &ground_;
    Snapshot const &before_;
    std::unique_ptr<Provider> provider_;
    std::mt19937_64 random_;
    std::map<std::string, std::string> made_; ///< from uuid to container
    uint64_t names_ = 0;
    uint64_t keys_ = 0;
    bool isCleaning_ = false;
    bool isInterrupted_ = false;
    kj::Promise<void> watch_ = nullptr; ///< sets isInterrupted_
};

/// Asks for everything that can be seen. @throws what an unanswered case throws
Snapshot takeSnapshot(Probe &probe);

template <typename T>
Outcome<T> Probe::ask(kj::Promise<Outcome<T>> promise, kj::TimePoint deadline) {
    auto answer = promise.then(
        [](Outcome<T> &&outcome) {
            return Race<T>{std::move(outcome), "", false};
        },
        [](kj::Exception &&failure) {
            return Race<T>{std::nullopt, "rejected: " + std::string(failure.getDescription().cStr()), false};
        });
    auto race = answer.exclusiveJoin(surroundings_.timer.atTime(deadline + grace).then([] { return Race<T>{}; }));
    if (surroundings_.interruption && !isCleaning_) {
        race = race.exclusiveJoin(surroundings_.interruption().then([&timer = surroundings_.timer] {
            return timer.afterDelay(farewell).then([] { return Race<T>{std::nullopt, "", true}; });
        }));
    }
    auto ended = race.wait(surroundings_.scope);
    // A provider that never waits leaves the clock where it was, and the next deadline would be counted from there.
    surroundings_.scope.poll();
    if (ended.isInterrupted) {
        throw Interrupted{};
    }
    expectTrue("a promise that gives a value or a failure", ended.rejection.empty(), printable(ended.rejection));
    expectTrue("an answer by the deadline", ended.outcome.has_value(), "none a second after it");
    return *std::move(ended.outcome);
}

} // namespace Orka::Conformance
