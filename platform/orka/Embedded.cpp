// SPDX-License-Identifier: Apache-2.0
#include "orka/Embedded.h"

#include "EmbeddedCore.h"

namespace Orka {

EmbeddedProvider::EmbeddedProvider(std::string path, ProviderSurroundings const &surroundings)
    : core_(kj::refcounted<Core>(std::move(path), surroundings)) {}

EmbeddedProvider::~EmbeddedProvider() noexcept = default;

Provider::Answer<Listing<StorageArray>> EmbeddedProvider::queryStorageArray(CallContext context) {
    return core_->run(context.deadline, [&core = *core_](ArrayFile &file) -> Listing<StorageArray> {
        auto const inventory = core.inventory(file);
        return {inventory.arrays, inventory.version};
    });
}

Provider::Answer<Listing<StorageContainer>> EmbeddedProvider::queryStorageContainer(CallContext context) {
    return core_->run(context.deadline, [&core = *core_](ArrayFile &file) -> Listing<StorageContainer> {
        auto const inventory = core.inventory(file);
        return {inventory.containers, inventory.version};
    });
}

Provider::Answer<VirtualVolume> EmbeddedProvider::createVirtualVolume(CallContext context, VolumeSpec spec) {
    return core_->run(context.deadline, [key = std::move(context.idempotencyKey), spec = std::move(spec)](
                                            ArrayFile &file) { return file.createVolume(key, spec); });
}

Provider::Answer<Done> EmbeddedProvider::deleteVirtualVolume(CallContext context, std::string containerId,
                                                             std::string uuid) {
    return core_->run(context.deadline, [key = std::move(context.idempotencyKey), containerId = std::move(containerId),
                                         uuid = std::move(uuid)](ArrayFile &file) {
        file.deleteVolume(key, containerId, uuid);
        return Done{};
    });
}

Provider::Answer<Done> EmbeddedProvider::bindVirtualVolume(CallContext context, std::string containerId,
                                                           std::string uuid, std::string endpointUid) {
    return core_->run(context.deadline,
                      [key = std::move(context.idempotencyKey), containerId = std::move(containerId),
                       uuid = std::move(uuid), endpointUid = std::move(endpointUid)](ArrayFile &file) {
                          file.bindVolume(key, containerId, uuid, endpointUid);
                          return Done{};
                      });
}

Provider::Answer<Done> EmbeddedProvider::unbindVirtualVolume(CallContext context, std::string containerId,
                                                             std::string uuid) {
    return core_->run(context.deadline, [key = std::move(context.idempotencyKey), containerId = std::move(containerId),
                                         uuid = std::move(uuid)](ArrayFile &file) {
        file.unbindVolume(key, containerId, uuid);
        return Done{};
    });
}

Provider::Answer<VirtualVolume> EmbeddedProvider::queryVirtualVolume(CallContext context, std::string containerId,
                                                                     std::string uuid) {
    return core_->run(context.deadline, [containerId = std::move(containerId), uuid = std::move(uuid)](
                                            ArrayFile &file) { return file.volume(containerId, uuid); });
}

Provider::Answer<std::vector<ConfigVolume>>
EmbeddedProvider::queryVirtualVolumesOfContainer(CallContext context, std::string containerId, int64_t max) {
    return core_->run(context.deadline, [containerId = std::move(containerId), max](ArrayFile &file) {
        return file.configVolumes(containerId, max);
    });
}

Provider::Answer<std::vector<VolumePresence>>
EmbeddedProvider::queryVirtualVolumesById(CallContext context, std::string containerId,
                                          std::vector<std::string> uuids) {
    return core_->run(context.deadline, [containerId = std::move(containerId), uuids = std::move(uuids)](
                                            ArrayFile &file) { return file.presence(containerId, uuids); });
}

Provider::Answer<std::optional<VirtualVolume>>
EmbeddedProvider::queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId,
                                                    std::string directoryName) {
    return core_->run(context.deadline,
                      [containerId = std::move(containerId), directoryName = std::move(directoryName)](
                          ArrayFile &file) { return file.volumeByDirectoryName(containerId, directoryName); });
}

Provider::Answer<std::vector<VirtualVolume>> EmbeddedProvider::queryVirtualVolumesBound(CallContext context) {
    return core_->run(context.deadline, [](ArrayFile &file) { return file.boundVolumes(); });
}

Provider::Answer<SpaceStats> EmbeddedProvider::spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                                          std::string uuid) {
    return core_->run(context.deadline, [containerId = std::move(containerId), uuid = std::move(uuid)](
                                            ArrayFile &file) { return file.spaceStats(containerId, uuid); });
}

Provider::Answer<UnsharedChunks>
EmbeddedProvider::unsharedChunksVirtualVolume(CallContext context, std::string containerId, std::string uuid) {
    return core_->run(context.deadline, [containerId = std::move(containerId), uuid = std::move(uuid)](
                                            ArrayFile &file) { return file.unsharedChunks(containerId, uuid); });
}

Provider::Answer<Metadata> EmbeddedProvider::getMetadata(CallContext context, std::string containerId,
                                                         std::string uuid) {
    return core_->run(context.deadline, [containerId = std::move(containerId), uuid = std::move(uuid)](
                                            ArrayFile &file) { return file.metadata(containerId, uuid); });
}

Provider::Answer<Done> EmbeddedProvider::setContext(CallContext context) {
    return core_->run(context.deadline, [orkaContext = std::move(context.orkaContext)](ArrayFile &file) {
        file.setHostContext(orkaContext);
        return Done{};
    });
}

} // namespace Orka
