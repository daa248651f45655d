// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <kj/refcount.h>
#include <kj/timer.h>

#include "orka/conformance/Bugs.h"

namespace Orka::Conformance {

/// The provider behind a bug, shared with promises that may outlive the bug.
struct Inner final : kj::Refcounted {
    Inner(std::unique_ptr<Provider> given, kj::Timer &clock)
        : provider(std::move(given))
        , timer(clock) {}

    std::unique_ptr<Provider> provider;
    kj::Timer &timer;
};

/// Hands every operation on as it is. A bug overrides the one that it gets wrong.
class Forwarding : public Provider {
public:
    Forwarding(std::unique_ptr<Provider> inner, kj::Timer &timer)
        : inner_(kj::refcounted<Inner>(std::move(inner), timer)) {}
    ~Forwarding() noexcept override = default;

    Answer<Listing<StorageArray>> queryStorageArray(CallContext context) override {
        return inner().queryStorageArray(std::move(context));
    }
    Answer<Listing<StorageContainer>> queryStorageContainer(CallContext context) override {
        return inner().queryStorageContainer(std::move(context));
    }
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        return inner().createVirtualVolume(std::move(context), std::move(spec));
    }
    Answer<Done> deleteVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        return inner().deleteVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                   std::string endpointUid) override {
        return inner().bindVirtualVolume(std::move(context), std::move(containerId), std::move(uuid),
                                         std::move(endpointUid));
    }
    Answer<Done> unbindVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        return inner().unbindVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<VirtualVolume> queryVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        return inner().queryVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override {
        return inner().queryVirtualVolumesOfContainer(std::move(context), std::move(containerId), max);
    }
    Answer<std::vector<VolumePresence>> queryVirtualVolumesById(CallContext context, std::string containerId,
                                                                std::vector<std::string> uuids) override {
        return inner().queryVirtualVolumesById(std::move(context), std::move(containerId), std::move(uuids));
    }
    Answer<std::optional<VirtualVolume>> queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId,
                                                                           std::string directoryName) override {
        return inner().queryVirtualVolumeByDirectoryName(std::move(context), std::move(containerId),
                                                         std::move(directoryName));
    }
    Answer<std::vector<VirtualVolume>> queryVirtualVolumesBound(CallContext context) override {
        return inner().queryVirtualVolumesBound(std::move(context));
    }
    Answer<SpaceStats> spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                  std::string uuid) override {
        return inner().spaceStatsForVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<UnsharedChunks> unsharedChunksVirtualVolume(CallContext context, std::string containerId,
                                                       std::string uuid) override {
        return inner().unsharedChunksVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<Metadata> getMetadata(CallContext context, std::string containerId, std::string uuid) override {
        return inner().getMetadata(std::move(context), std::move(containerId), std::move(uuid));
    }
    Answer<Done> setContext(CallContext context) override {
        return inner().setContext(std::move(context));
    }

protected:
    Provider &inner() {
        return *inner_->provider;
    }
    kj::Timer &timer() {
        return inner_->timer;
    }
    /// For what a promise still has to ask.
    kj::Own<Inner> share() {
        return kj::addRef(*inner_);
    }

private:
    kj::Own<Inner> inner_;
};

/// An answer that is changed on its way; failures pass.
template <typename T, typename Change>
kj::Promise<Outcome<T>> changed(kj::Promise<Outcome<T>> promise, Change change) {
    return promise.then([change = std::move(change)](Outcome<T> &&outcome) mutable -> Outcome<T> {
        if (!outcome.ok()) {
            return std::move(outcome);
        }
        auto value = std::move(outcome).value();
        change(value);
        return value;
    });
}

/// What else is done in place of a failure with a code; everything else passes.
template <typename T, typename Otherwise>
kj::Promise<Outcome<T>> otherwise(kj::Promise<Outcome<T>> promise, Wire::ErrorCode code, Otherwise instead) {
    return promise.then([code, instead = std::move(instead)](Outcome<T> &&outcome) mutable -> kj::Promise<Outcome<T>> {
        if (outcome.ok() || outcome.failure().code() != code) {
            return std::move(outcome);
        }
        return instead(outcome.failure());
    });
}

template <typename Buggy>
std::unique_ptr<Provider> put(std::unique_ptr<Provider> inner, kj::Timer &timer) {
    return std::make_unique<Buggy>(std::move(inner), timer);
}

// One function a file of bugs.
std::vector<Bug> listBugs();
std::vector<Bug> mutationBugs();
std::vector<Bug> answerBugs();
std::vector<Bug> keyBugs();

} // namespace Orka::Conformance
