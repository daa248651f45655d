// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "Async.h"
#include "Call.h"
#include "Services.h"
#include "orka/Provider.h"

namespace Lumod {

/// The operations of one provider on behalf of one request. Each one goes past the injected states and the fault rules,
/// carries the deadline and the Orka context, gets an idempotency key if it changes something, and is logged under the
/// request's trace id. What it failed with names the provider.
///
/// Failures besides the provider's own: ProviderOffline, ProviderBusy (a change while it is in syncError), Fault*.
class ProviderCalls {
public:
    ProviderCalls(Services &services, ProviderPtr provider, CallPtr call)
        : services_(services)
        , entry_(std::move(provider))
        , call_(std::move(call)) {}

    Answer<Orka::Listing<Orka::StorageArray>> queryStorageArray() const;
    Answer<Orka::Listing<Orka::StorageContainer>> queryStorageContainer() const;
    Answer<Orka::VirtualVolume> createVirtualVolume(Orka::VolumeSpec spec) const;
    Answer<Done> deleteVirtualVolume(std::string containerId, std::string uuid) const;
    Answer<Done> bindVirtualVolume(std::string containerId, std::string uuid, std::string endpointUid) const;
    Answer<Done> unbindVirtualVolume(std::string containerId, std::string uuid) const;
    Answer<Orka::VirtualVolume> queryVirtualVolume(std::string containerId, std::string uuid) const;
    Answer<std::vector<Orka::ConfigVolume>> queryVirtualVolumesOfContainer(std::string containerId, int64_t max) const;
    Answer<std::vector<Orka::VolumePresence>> queryVirtualVolumesById(std::string containerId,
                                                                      std::vector<std::string> uuids) const;
    Answer<std::optional<Orka::VirtualVolume>> queryVirtualVolumeByDirectoryName(std::string containerId,
                                                                                 std::string directoryName) const;
    Answer<Orka::SpaceStats> spaceStatsForVirtualVolume(std::string containerId, std::string uuid) const;
    Answer<Orka::UnsharedChunks> unsharedChunksVirtualVolume(std::string containerId, std::string uuid) const;
    Answer<Orka::Metadata> getMetadata(std::string containerId, std::string uuid) const;
    /// Tells the context that the host store holds now.
    Answer<Done> setContext() const;

    ProviderPtr const &provider() const {
        return entry_;
    }

private:
    template <typename T, typename Function>
    Answer<T> perform(Operation operation, Function &&function) const;
    std::optional<Wire::Failure> hindrance(Operation operation) const;
    Orka::CallContext contextFor(Operation operation) const;

    Services &services_;
    ProviderPtr entry_;
    CallPtr call_;
};

} // namespace Lumod
