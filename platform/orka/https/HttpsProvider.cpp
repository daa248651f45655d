// SPDX-License-Identifier: Apache-2.0
#include "https/HttpsProvider.h"

#include <fmt/format.h>

#include "https/HttpsCore.h"

namespace Orka::Https {

namespace {

auto const doneOr = [](Outcome<DoneAnswer> &&outcome) -> Outcome<Done> {
    if (!outcome.ok()) {
        return outcome.failure();
    }
    return Done{};
};

} // namespace

HttpsProvider::Core::Core(Url url, ProviderSurroundings const &surroundings)
    : exchange_(kj::refcounted<Exchange>(
          kj::refcounted<Line>(std::move(url), surroundings.certificates, *surroundings.network, surroundings.timer),
          surroundings.timer))
    , timer_(surroundings.timer) {}

Envelope HttpsProvider::Core::envelopeOf(CallContext const &context, bool isChange) const {
    Envelope envelope;
    envelope.orkaContext = context.orkaContext;
    if (isChange && !context.idempotencyKey.empty()) {
        envelope.idempotencyKey = context.idempotencyKey;
    }
    auto const left = std::max(context.deadline - timer_.now(), 0 * kj::MILLISECONDS);
    envelope.timeoutMs = static_cast<int64_t>(left / kj::MILLISECONDS);
    return envelope;
}

Wire::Failure HttpsProvider::Core::lie(char const *operation, std::string const &did) const {
    return {Wire::ErrorCode::ProtocolError,
            fmt::format("the provider at {} answered {} {}", exchange_->authority(), operation, did)};
}

Wire::Failure HttpsProvider::Core::unreadable(Wire::Failure const &failure) const {
    return {Wire::ErrorCode::ProtocolError,
            fmt::format("the provider at {} gave an answer that is not what it should be: {}", exchange_->authority(),
                        failure.sentence())};
}

HttpsProvider::HttpsProvider(Url url, ProviderSurroundings const &surroundings)
    : core_(kj::refcounted<Core>(std::move(url), surroundings)) {}

HttpsProvider::~HttpsProvider() noexcept = default;

Provider::Answer<Listing<StorageArray>> HttpsProvider::queryStorageArray(CallContext context) {
    return core_->listing<StorageArray>("queryStorageArray", std::move(context));
}

Provider::Answer<Listing<StorageContainer>> HttpsProvider::queryStorageContainer(CallContext context) {
    return core_->listing<StorageContainer>("queryStorageContainer", std::move(context));
}

Provider::Answer<VirtualVolume> HttpsProvider::createVirtualVolume(CallContext context, VolumeSpec spec) {
    return core_->call<VirtualVolume>("createVirtualVolume", context, true, CreateRequest{std::move(spec)});
}

Provider::Answer<Done> HttpsProvider::deleteVirtualVolume(CallContext context, std::string containerId,
                                                          std::string uuid) {
    return core_
        ->call<DoneAnswer>("deleteVirtualVolume", context, true, VolumeRequest{std::move(containerId), std::move(uuid)})
        .then(doneOr);
}

Provider::Answer<Done> HttpsProvider::bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                                        std::string endpointUid) {
    return core_
        ->call<DoneAnswer>("bindVirtualVolume", context, true,
                           BindRequest{std::move(containerId), std::move(uuid), std::move(endpointUid)})
        .then(doneOr);
}

Provider::Answer<Done> HttpsProvider::unbindVirtualVolume(CallContext context, std::string containerId,
                                                          std::string uuid) {
    return core_
        ->call<DoneAnswer>("unbindVirtualVolume", context, true, VolumeRequest{std::move(containerId), std::move(uuid)})
        .then(doneOr);
}

Provider::Answer<VirtualVolume> HttpsProvider::queryVirtualVolume(CallContext context, std::string containerId,
                                                                  std::string uuid) {
    return core_->call<VirtualVolume>("queryVirtualVolume", context, false,
                                      VolumeRequest{std::move(containerId), std::move(uuid)});
}

Provider::Answer<std::vector<ConfigVolume>>
HttpsProvider::queryVirtualVolumesOfContainer(CallContext context, std::string containerId, int64_t max) {
    VolumesOfContainerRequest request;
    request.containerId = std::move(containerId);
    request.max = max;
    auto const most = static_cast<std::size_t>(std::max<int64_t>(max, 0));
    return core_->pages<ConfigVolume>("queryVirtualVolumesOfContainer", std::move(context), std::move(request), most);
}

kj::Promise<Outcome<std::vector<VolumePresence>>> HttpsProvider::Core::presence(CallContext context,
                                                                                std::string containerId,
                                                                                std::vector<std::string> uuids,
                                                                                std::vector<VolumePresence> found) {
    using Result = Outcome<std::vector<VolumePresence>>;
    VolumesByIdRequest request;
    request.containerId = containerId;
    auto const begin = uuids.begin() + static_cast<std::ptrdiff_t>(found.size());
    request.uuids.assign(begin,
                         begin + static_cast<std::ptrdiff_t>(std::min(uuids.size() - found.size(), idsPerRequestMax)));
    auto const asked = request.uuids.size();
    return call<ItemsAnswer<VolumePresence>>("queryVirtualVolumesById", context, false, request)
        .then([self = kj::addRef(*this), context, containerId = std::move(containerId), uuids = std::move(uuids),
               found = std::move(found),
               asked](Outcome<ItemsAnswer<VolumePresence>> &&answer) mutable -> kj::Promise<Result> {
            if (!answer.ok()) {
                return Result(answer.failure());
            }
            auto const items = std::move(answer).value().items;
            if (items.size() != asked) {
                return Result(
                    self->lie("queryVirtualVolumesById", fmt::format("about {} of {} ids", items.size(), asked)));
            }
            found.insert(found.end(), items.begin(), items.end());
            if (found.size() == uuids.size()) {
                return Result(std::move(found));
            }
            auto &core = *self;
            return core.presence(std::move(context), std::move(containerId), std::move(uuids), std::move(found))
                .attach(kj::mv(self));
        });
}

Provider::Answer<std::vector<VolumePresence>>
HttpsProvider::queryVirtualVolumesById(CallContext context, std::string containerId, std::vector<std::string> uuids) {
    return core_->presence(std::move(context), std::move(containerId), std::move(uuids), {});
}

Provider::Answer<std::optional<VirtualVolume>>
HttpsProvider::queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId,
                                                 std::string directoryName) {
    return core_
        ->call<MaybeVolumeAnswer>("queryVirtualVolumeByDirectoryName", context, false,
                                  VolumeByDirectoryNameRequest{std::move(containerId), std::move(directoryName)})
        .then([](Outcome<MaybeVolumeAnswer> &&answer) -> Outcome<std::optional<VirtualVolume>> {
            if (!answer.ok()) {
                return answer.failure();
            }
            return std::move(answer).value().volume;
        });
}

Provider::Answer<std::vector<VirtualVolume>> HttpsProvider::queryVirtualVolumesBound(CallContext context) {
    return core_->pages<VirtualVolume>("queryVirtualVolumesBound", std::move(context), BoundVolumesRequest(),
                                       listItemsMax);
}

Provider::Answer<SpaceStats> HttpsProvider::spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                                       std::string uuid) {
    return core_->call<SpaceStats>("spaceStatsForVirtualVolume", context, false,
                                   VolumeRequest{std::move(containerId), std::move(uuid)});
}

Provider::Answer<UnsharedChunks> HttpsProvider::unsharedChunksVirtualVolume(CallContext context,
                                                                            std::string containerId, std::string uuid) {
    return core_->call<UnsharedChunks>("unsharedChunksVirtualVolume", context, false,
                                       VolumeRequest{std::move(containerId), std::move(uuid)});
}

Provider::Answer<Metadata> HttpsProvider::getMetadata(CallContext context, std::string containerId, std::string uuid) {
    return core_
        ->call<ItemsAnswer<MetadataPair>>("getMetadata", context, false,
                                          VolumeRequest{std::move(containerId), std::move(uuid)})
        .then([](Outcome<ItemsAnswer<MetadataPair>> &&answer) -> Outcome<Metadata> {
            if (!answer.ok()) {
                return answer.failure();
            }
            return std::move(answer).value().items;
        });
}

Provider::Answer<Done> HttpsProvider::setContext(CallContext context) {
    return core_->call<DoneAnswer>("setContext", context, false, ContextRequest()).then(doneOr);
}

} // namespace Orka::Https
