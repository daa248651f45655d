// SPDX-License-Identifier: Apache-2.0
//
// The provider that opens an array file in the process. The file is opened by the first operation, again when it has
// been replaced, and again after it failed, so that an operation's outcome tells how the file is now, not how it was
// once.
//
// The event loop never waits for another process's lock: an attempt that meets one is repeated on the timer until the
// operation's deadline, so that a locked file is a slow provider and, at the deadline, a busy one. What does happen on
// the loop is reading, and syncing a commit.
#pragma once

#include <string>

#include <kj/memory.h>

#include "orka/ProviderFactory.h"

namespace Orka {

class EmbeddedProvider final : public Provider {
public:
    EmbeddedProvider(std::string path, ProviderSurroundings const &surroundings);
    ~EmbeddedProvider() noexcept override;

    Answer<Listing<StorageArray>> queryStorageArray(CallContext context) override;
    Answer<Listing<StorageContainer>> queryStorageContainer(CallContext context) override;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override;
    Answer<Done> deleteVirtualVolume(CallContext context, std::string containerId, std::string uuid) override;
    Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                   std::string endpointUid) override;
    Answer<Done> unbindVirtualVolume(CallContext context, std::string containerId, std::string uuid) override;
    Answer<VirtualVolume> queryVirtualVolume(CallContext context, std::string containerId, std::string uuid) override;
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override;
    Answer<std::vector<VolumePresence>> queryVirtualVolumesById(CallContext context, std::string containerId,
                                                                std::vector<std::string> uuids) override;
    Answer<std::optional<VirtualVolume>> queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId,
                                                                           std::string directoryName) override;
    Answer<std::vector<VirtualVolume>> queryVirtualVolumesBound(CallContext context) override;
    Answer<SpaceStats> spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                  std::string uuid) override;
    Answer<UnsharedChunks> unsharedChunksVirtualVolume(CallContext context, std::string containerId,
                                                       std::string uuid) override;
    Answer<Metadata> getMetadata(CallContext context, std::string containerId, std::string uuid) override;
    Answer<Done> setContext(CallContext context) override;

private:
    class Core;

    /// Shared with the promises, which may outlive this object.
    kj::Own<Core> core_;
};

} // namespace Orka
