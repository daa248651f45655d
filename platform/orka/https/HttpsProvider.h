// SPDX-License-Identifier: Apache-2.0
//
// The provider that is a server elsewhere. Each operation is one request (a list, one a page), over TLS and in JSON;
// docs/provider-protocol.md tells the other side of it.
//
// What comes from outside is believed in nothing: it is bounded, checked and told by its faults. Every failure names
// host and port, but for what the array itself refuses, which is passed on in its own words.
#pragma once

#include <string>

#include <kj/memory.h>

#include "https/Url.h"
#include "orka/ProviderFactory.h"

namespace Orka::Https {

class HttpsProvider final : public Provider {
public:
    /// @param surroundings with a network
    HttpsProvider(Url url, ProviderSurroundings const &surroundings);
    ~HttpsProvider() noexcept override;

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

} // namespace Orka::Https
