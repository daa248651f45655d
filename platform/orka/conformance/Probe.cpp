// SPDX-License-Identifier: Apache-2.0
#include "conformance/Probe.h"

#include <algorithm>

namespace Orka::Conformance {

// NOLINTNEXTLINE(cert-msc32-c,cert-msc51-cpp): begin() seeds
Probe::Probe(Surroundings const &surroundings, Ground const &ground, Snapshot const &before)
    : surroundings_(surroundings)
    , ground_(ground)
    , before_(before)
    , provider_(surroundings.connect()) {
    if (surroundings.interruption) {
        watch_ = surroundings.interruption().then([this] { isInterrupted_ = true; }).eagerlyEvaluate(nullptr);
    }
}

void Probe::begin(std::string const &caseName) {
    reconnect();
    // A case does the same whichever others run beside it.
    auto seed = surroundings_.seed;
    for (auto const character : caseName) {
        seed = seed * 1099511628211U + static_cast<unsigned char>(character);
    }
    random_.seed(seed);
}

CallContext Probe::context(std::string key) const {
    return within(surroundings_.timeout, std::move(key));
}

CallContext Probe::within(kj::Duration time, std::string key) const {
    if (isInterrupted_ && !isCleaning_) {
        throw Interrupted{};
    }
    return {surroundings_.timer.now() + time, std::nullopt, std::move(key)};
}

std::string Probe::freshName() {
    return ownNamePrefix + surroundings_.runId + '-' + std::to_string(++names_);
}

std::string Probe::freshKey() {
    return ownNamePrefix + surroundings_.runId + "-key-" + std::to_string(++keys_);
}

uint32_t Probe::choose(uint32_t below) {
    // The standard's distributions differ between libraries; this does not.
    return static_cast<uint32_t>(random_() % below);
}

VolumeSpec Probe::freshSpec() {
    VolumeSpec spec;
    spec.containerId = containerId();
    spec.directoryName = freshName();
    return spec;
}

void Probe::pass(kj::Duration time) {
    surroundings_.timer.afterDelay(time).wait(surroundings_.scope);
}

Outcome<VirtualVolume> Probe::tryMake(VolumeSpec const &spec, std::string const &key) {
    auto outcome = ask(provider_->createVirtualVolume(context(key), spec));
    if (outcome.ok()) {
        made_[outcome.value().uuid] = spec.containerId;
    }
    return outcome;
}

Outcome<Done> Probe::tryRemove(VirtualVolume const &volume, std::string const &key) {
    return ask(provider_->deleteVirtualVolume(context(key), volume.containerId, volume.uuid));
}

Outcome<Done> Probe::tryBind(VirtualVolume const &volume, std::string const &endpoint, std::string const &key) {
    return ask(provider_->bindVirtualVolume(context(key), volume.containerId, volume.uuid, endpoint));
}

Outcome<Done> Probe::tryUnbind(VirtualVolume const &volume, std::string const &key) {
    return ask(provider_->unbindVirtualVolume(context(key), volume.containerId, volume.uuid));
}

VirtualVolume Probe::make(VolumeSpec const &spec) {
    return expectSuccess("a volume is made", tryMake(spec, freshKey()));
}

void Probe::remove(VirtualVolume const &volume) {
    expectSuccess("a volume that is not bound is deleted", tryRemove(volume, freshKey()));
}

void Probe::bind(VirtualVolume const &volume, std::string const &endpoint) {
    expectSuccess("a volume is bound to an accessible endpoint", tryBind(volume, endpoint, freshKey()));
}

void Probe::unbind(VirtualVolume const &volume) {
    expectSuccess("a volume is unbound", tryUnbind(volume, freshKey()));
}

VirtualVolume Probe::facts(VirtualVolume const &volume) {
    return expectSuccess("a volume's facts",
                         ask(provider_->queryVirtualVolume(context(), volume.containerId, volume.uuid)));
}

std::vector<ConfigVolume> Probe::list(std::string const &containerId, int64_t max) {
    return expectSuccess("the container's config volumes",
                         ask(provider_->queryVirtualVolumesOfContainer(context(), containerId, max)));
}

std::vector<VolumePresence> Probe::presence(std::string const &containerId, std::vector<std::string> const &uuids) {
    auto answers = expectSuccess("what is known of each id",
                                 ask(provider_->queryVirtualVolumesById(context(), containerId, uuids)));
    expectEqual("as many answers as ids", uint64_t{uuids.size()}, uint64_t{answers.size()});
    return answers;
}

bool Probe::exists(VirtualVolume const &volume) {
    return presence(volume.containerId, {volume.uuid})[0].exists;
}

std::optional<VirtualVolume> Probe::byName(std::string const &containerId, std::string const &name) {
    return expectSuccess("the config volume of a name, or nothing",
                         ask(provider_->queryVirtualVolumeByDirectoryName(context(), containerId, name)));
}

std::vector<VirtualVolume> Probe::bound() {
    return expectSuccess("every volume that is bound", ask(provider_->queryVirtualVolumesBound(context())));
}

int64_t Probe::countNamed(std::string const &name) {
    auto const volumes = list(containerId());
    return std::count_if(volumes.begin(), volumes.end(),
                         [&](ConfigVolume const &volume) { return volume.directoryName == name; });
}

std::string Probe::tryRemoveOwn(VirtualVolume const &volume) {
    try {
        // Whatever comes of unbinding: a provider that gets that wrong may delete all the same.
        auto const unbound = tryUnbind(volume, freshKey());
        auto const removed = tryRemove(volume, freshKey());
        bool const isGone = removed.ok() || removed.failure().code() == Wire::ErrorCode::NoSuchVolume;
        return isGone ? std::string() : show(removed.failure());
    } catch (Unmet const &unmet) {
        return unmet.came;
    }
}

void Probe::removeOwn(std::string const &containerId, std::string const &uuid, std::vector<std::string> &failures) {
    VirtualVolume volume;
    volume.containerId = containerId;
    volume.uuid = uuid;
    // What fails now and then shall leave nothing behind.
    constexpr int attempts = 5;
    auto why = tryRemoveOwn(volume);
    for (int attempt = 1; attempt < attempts && !why.empty(); ++attempt) {
        pass(attempt * 10 * kj::MILLISECONDS);
        reconnect();
        why = tryRemoveOwn(volume);
    }
    if (!why.empty()) {
        failures.push_back("the volume " + show(uuid) + " could not be removed: " + why);
    }
}

std::vector<std::string> Probe::cleanUp() {
    std::vector<std::string> failures;
    isCleaning_ = true;
    if (isInterrupted_) {
        // What was cut off on its way may take effect yet.
        pass(farewell / 10);
    }
    // Whatever the case did to its connection.
    reconnect();
    for (auto const &container : ground_.touched()) {
        try {
            for (auto const &volume : list(container.id)) {
                if (volume.directoryName.rfind(ownNamePrefix + surroundings_.runId + '-', 0) == 0) {
                    made_[volume.uuid] = container.id;
                }
            }
        } catch (Unmet const &unmet) {
            failures.push_back("the storage container " + show(container.id) +
                               " could not be looked through: " + unmet.came);
        }
    }
    for (auto const &[uuid, container] : made_) {
        removeOwn(container, uuid, failures);
    }
    made_.clear();
    isCleaning_ = false;
    return failures;
}

Snapshot takeSnapshot(Probe &probe) {
    Snapshot snapshot;
    snapshot.arrays =
        *expectSuccess("the storage arrays", probe.ask(probe.provider().queryStorageArray(probe.context()))).items;
    snapshot.containers =
        *expectSuccess("the storage containers", probe.ask(probe.provider().queryStorageContainer(probe.context())))
             .items;
    for (auto const &container : probe.ground().touched()) {
        snapshot.configVolumes[container.id] = probe.list(container.id);
    }
    snapshot.bound = probe.bound();
    return snapshot;
}

} // namespace Orka::Conformance
