// SPDX-License-Identifier: Apache-2.0
#include "https/ServiceOperations.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

#include <fmt/format.h>

#include "https/HeldLists.h"
#include "https/Protocol.h"

namespace Orka {

using namespace Https;

namespace {

using Answered = kj::Promise<Outcome<std::string>>;

/// A request that does not say how long it waits, and the longest that one is worked on.
constexpr int64_t defaultTimeoutMs = 30000;
constexpr int64_t longestTimeoutMs = 120000;

std::size_t pageSizeOf(std::optional<int64_t> const &asked) {
    return static_cast<std::size_t>(std::clamp<int64_t>(asked.value_or(pageItemsMax), 1, pageItemsMax));
}

/// Sends on what a provider answers with, as `make(value)` turns it into a body.
template <typename T, typename Function>
Answered bodyFrom(kj::Promise<Outcome<T>> promise, Function make) {
    return promise.then([make = std::move(make)](Outcome<T> &&outcome) -> Outcome<std::string> {
        if (!outcome.ok()) {
            return outcome.failure();
        }
        return outcomeOf([&] { return make(std::move(outcome).value()); });
    });
}

template <typename T>
Answered wholeBody(kj::Promise<Outcome<T>> promise) {
    return bodyFrom(std::move(promise), [](T &&value) { return bodyOf(value); });
}

Answered doneBody(kj::Promise<Outcome<Done>> promise) {
    return bodyFrom(std::move(promise), [](Done &&) { return bodyOf(DoneAnswer()); });
}

template <typename T>
Answered itemsBody(kj::Promise<Outcome<std::vector<T>>> promise) {
    return bodyFrom(std::move(promise),
                    [](std::vector<T> &&items) { return bodyOf(ItemsAnswer<T>{std::move(items)}); });
}

template <typename Work>
Answered listBody(ServiceOperations operations, std::string const &body, Work work) {
    return operations.on<ListRequest>(body, [&](CallContext context, ListRequest request) -> Answered {
        auto const most = pageSizeOf(request.pageSize);
        if (request.page) {
            return Outcome<std::string>(operations.heldPage(*request.page, most));
        }
        return bodyFrom(work(operations.provider(), std::move(context)), [operations, request, most](auto &&listing) {
            auto version = fmt::format("{}-{}", operations.instance(), listing.version);
            using T = std::remove_const_t<typename std::remove_reference_t<decltype(*listing.items)>::value_type>;
            if (request.knownVersion == version) {
                return bodyOf(ListAnswer<T>{version, true, {}, std::nullopt});
            }
            return operations.firstPage<T>(listing.items, version, most);
        });
    });
}

template <typename T>
Answered pagedBody(ServiceOperations operations, kj::Promise<Outcome<std::vector<T>>> promise, std::size_t most) {
    return bodyFrom(std::move(promise), [operations, most](std::vector<T> &&items) {
        return operations.firstPage<T>(std::make_shared<std::vector<T> const>(std::move(items)), std::nullopt, most);
    });
}

Answered queryStorageArray(ServiceOperations operations, std::string const &body) {
    return listBody(operations, body, [](Provider &provider, CallContext context) {
        return provider.queryStorageArray(std::move(context));
    });
}

Answered queryStorageContainer(ServiceOperations operations, std::string const &body) {
    return listBody(operations, body, [](Provider &provider, CallContext context) {
        return provider.queryStorageContainer(std::move(context));
    });
}

Answered createVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<CreateRequest>(body, [&](CallContext context, CreateRequest request) {
        return wholeBody(operations.provider().createVirtualVolume(std::move(context), std::move(request.spec)));
    });
}

Answered deleteVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return doneBody(operations.provider().deleteVirtualVolume(std::move(context), std::move(request.containerId),
                                                                  std::move(request.uuid)));
    });
}

Answered bindVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<BindRequest>(body, [&](CallContext context, BindRequest request) {
        return doneBody(operations.provider().bindVirtualVolume(std::move(context), std::move(request.containerId),
                                                                std::move(request.uuid),
                                                                std::move(request.endpointUid)));
    });
}

Answered unbindVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return doneBody(operations.provider().unbindVirtualVolume(std::move(context), std::move(request.containerId),
                                                                  std::move(request.uuid)));
    });
}

Answered queryVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return wholeBody(operations.provider().queryVirtualVolume(std::move(context), std::move(request.containerId),
                                                                  std::move(request.uuid)));
    });
}

Answered queryVirtualVolumesOfContainer(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumesOfContainerRequest>(
        body, [&](CallContext context, VolumesOfContainerRequest request) -> Answered {
            auto const most = pageSizeOf(request.pageSize);
            if (request.page) {
                return Outcome<std::string>(operations.heldPage(*request.page, most));
            }
            return pagedBody(operations,
                             operations.provider().queryVirtualVolumesOfContainer(
                                 std::move(context), std::move(request.containerId), request.max),
                             most);
        });
}

Answered queryVirtualVolumesById(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumesByIdRequest>(body, [&](CallContext context, VolumesByIdRequest request) -> Answered {
        if (request.uuids.size() > idsPerRequestMax) {
            return Outcome<std::string>(Wire::Failure(
                Wire::ErrorCode::TooLarge, fmt::format("a request may ask about {} ids at most", idsPerRequestMax)));
        }
        return itemsBody(operations.provider().queryVirtualVolumesById(
            std::move(context), std::move(request.containerId), std::move(request.uuids)));
    });
}

Answered queryVirtualVolumeByDirectoryName(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeByDirectoryNameRequest>(body, [&](CallContext context,
                                                                 VolumeByDirectoryNameRequest request) {
        return bodyFrom(
            operations.provider().queryVirtualVolumeByDirectoryName(std::move(context), std::move(request.containerId),
                                                                    std::move(request.directoryName)),
            [](std::optional<VirtualVolume> &&volume) { return bodyOf(MaybeVolumeAnswer{std::move(volume)}); });
    });
}

Answered queryVirtualVolumesBound(ServiceOperations operations, std::string const &body) {
    return operations.on<BoundVolumesRequest>(body, [&](CallContext context, BoundVolumesRequest request) -> Answered {
        auto const most = pageSizeOf(request.pageSize);
        if (request.page) {
            return Outcome<std::string>(operations.heldPage(*request.page, most));
        }
        return pagedBody(operations, operations.provider().queryVirtualVolumesBound(std::move(context)), most);
    });
}

Answered spaceStatsForVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return wholeBody(operations.provider().spaceStatsForVirtualVolume(
            std::move(context), std::move(request.containerId), std::move(request.uuid)));
    });
}

Answered unsharedChunksVirtualVolume(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return wholeBody(operations.provider().unsharedChunksVirtualVolume(
            std::move(context), std::move(request.containerId), std::move(request.uuid)));
    });
}

Answered getMetadata(ServiceOperations operations, std::string const &body) {
    return operations.on<VolumeRequest>(body, [&](CallContext context, VolumeRequest request) {
        return itemsBody(operations.provider().getMetadata(std::move(context), std::move(request.containerId),
                                                           std::move(request.uuid)));
    });
}

Answered setContext(ServiceOperations operations, std::string const &body) {
    return operations.on<ContextRequest>(body, [&](CallContext context, ContextRequest) {
        return doneBody(operations.provider().setContext(std::move(context)));
    });
}

constexpr std::array<std::pair<std::string_view, ServiceOperations::Work>, 15> works{{
    {"queryStorageArray", queryStorageArray},
    {"queryStorageContainer", queryStorageContainer},
    {"createVirtualVolume", createVirtualVolume},
    {"deleteVirtualVolume", deleteVirtualVolume},
    {"bindVirtualVolume", bindVirtualVolume},
    {"unbindVirtualVolume", unbindVirtualVolume},
    {"queryVirtualVolume", queryVirtualVolume},
    {"queryVirtualVolumesOfContainer", queryVirtualVolumesOfContainer},
    {"queryVirtualVolumesById", queryVirtualVolumesById},
    {"queryVirtualVolumeByDirectoryName", queryVirtualVolumeByDirectoryName},
    {"queryVirtualVolumesBound", queryVirtualVolumesBound},
    {"spaceStatsForVirtualVolume", spaceStatsForVirtualVolume},
    {"unsharedChunksVirtualVolume", unsharedChunksVirtualVolume},
    {"getMetadata", getMetadata},
    {"setContext", setContext},
}};

} // namespace

ServiceOperations::Work ServiceOperations::named(std::string_view operation) {
    auto const found =
        std::find_if(works.begin(), works.end(), [&](auto const &work) { return work.first == operation; });
    return found == works.end() ? nullptr : found->second;
}

CallContext ServiceOperations::contextOf(Envelope const &envelope) const {
    auto const timeout = std::min(envelope.timeoutMs.value_or(defaultTimeoutMs), longestTimeoutMs);
    return {service.timer_.now() + timeout * kj::MILLISECONDS, envelope.orkaContext,
            envelope.idempotencyKey.value_or("")};
}

std::string ServiceOperations::newToken() const {
    return fmt::format("{}-{}", service.instance_, ++service.listCount_);
}

std::string ServiceOperations::heldPage(std::string const &page, std::size_t most) const {
    // TOKEN.OFFSET
    auto const dot = page.rfind('.');
    std::size_t offset = 0;
    auto const *const end = page.data() + page.size();
    bool const isWhole =
        dot != std::string::npos && std::from_chars(page.data() + dot + 1, end, offset).ptr == end && offset > 0;
    auto const *const pages = isWhole ? service.held_->find(std::string_view(page).substr(0, dot)) : nullptr;
    if (pages == nullptr) {
        throw Wire::Failure(stalePageCode, "the page is not known any more; begin with the first one");
    }
    return (*pages)(offset, most);
}

namespace {

struct Page {
    std::string body;
    bool isLast;
};

template <typename T>
Page pageOf(std::vector<T> const &items, std::optional<std::string> const &version, std::string const &token,
            std::size_t offset, std::size_t most) {
    BodyWriter writer;
    writer.begin();
    if (version) {
        writer.name("version", *version);
        writer.flag("unchanged", false);
    }
    auto const next = offset + writer.slice("items", items, offset, most, pageBytesMax);
    bool const isLast = next >= items.size();
    if (!isLast) {
        writer.text("nextPage", fmt::format("{}.{}", token, next));
    }
    writer.end();
    return {writer.take(), isLast};
}

} // namespace

template <typename T>
std::string ServiceOperations::firstPage(std::shared_ptr<std::vector<T> const> items,
                                         std::optional<std::string> version, std::size_t most) const {
    auto const token = newToken();
    auto first = pageOf(*items, version, token, 0, most);
    if (!first.isLast) {
        service.held_->hold(token, std::move(items), [&](std::shared_ptr<std::vector<T> const> kept) {
            return [kept = std::move(kept), version, token](std::size_t offset, std::size_t pageItems) {
                return pageOf(*kept, version, token, offset, pageItems).body;
            };
        });
    }
    return std::move(first.body);
}

} // namespace Orka
