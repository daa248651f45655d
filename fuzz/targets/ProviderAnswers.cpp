// SPDX-License-Identifier: Apache-2.0
//
// A provider on the network answers with any bytes: HTTP, JSON and what it says. The input's first byte chooses the
// operation, the rest is what comes over each connection. TLS is left out (it is not ours): the stand-in for Trust at
// the end trusts the connection as it is.
#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include <kj/debug.h>

#include "Property.h"
#include "World.h"
#include "https/Protocol.h"
#include "https/Trust.h"
#include "orka/ProviderFactory.h"
#include "plexa/Text.h"
#include "wire/ContainerId.h"

namespace {

using Fuzz::require;
using namespace Orka;

/// Every address is that of the one peer, which says the same over each connection. A connection takes a second to
/// make, so that a list whose pages each have a next one meets the deadline, as it would elsewhere.
class Network final : public kj::Network, public kj::NetworkAddress {
public:
    Network(kj::Timer &timer, std::string_view says)
        : timer_(timer)
        , says_(says) {}

    kj::Promise<kj::Own<kj::NetworkAddress>> parseAddress(kj::StringPtr, kj::uint) override {
        return clone();
    }
    kj::Own<kj::NetworkAddress> getSockaddr(void const *, kj::uint) override {
        return clone();
    }
    kj::Own<kj::Network> restrictPeers(kj::ArrayPtr<kj::StringPtr const>, kj::ArrayPtr<kj::StringPtr const>) override {
        return {this, kj::NullDisposer::instance};
    }
    kj::Promise<kj::Own<kj::AsyncIoStream>> connect() override {
        return timer_.afterDelay(1 * kj::SECONDS).then([this] {
            auto pipe = kj::newTwoWayPipe();
            peers_.push_back(std::make_unique<Fuzz::Peer>(kj::mv(pipe.ends[0]), says_));
            return kj::mv(pipe.ends[1]);
        });
    }
    kj::Own<kj::ConnectionReceiver> listen() override {
        KJ_UNIMPLEMENTED("nobody listens here");
    }
    kj::Own<kj::NetworkAddress> clone() override {
        return {static_cast<kj::NetworkAddress *>(this), kj::NullDisposer::instance};
    }
    kj::String toString() override {
        return kj::str("array.test");
    }

private:
    kj::Timer &timer_;
    std::string says_;
    std::vector<std::unique_ptr<Fuzz::Peer>> peers_;
};

/// What a value that was read from an answer is held to: what the reader promises of each member.
struct Checks {
    static void check(std::string const &text) {
        require(Plexa::isValidUtf8(text), "a text is UTF-8", text);
        require(text.find('\0') == std::string::npos, "a text holds no NUL", text);
    }
    static void check(std::optional<std::string> const &text) {
        check(text.value_or(""));
    }
    static void checkId(std::string const &id) {
        require(Wire::normalizeContainerId(id) == id, "an id is canonical", id);
    }
    static void checkAmount(int64_t amount) {
        require(amount >= 0, "an amount is not negative", std::to_string(amount));
    }
    static void check(Endpoint const &endpoint) {
        check(endpoint.uid);
        check(endpoint.text1);
        check(endpoint.text2);
        std::for_each(endpoint.nfs4xAddresses.begin(), endpoint.nfs4xAddresses.end(),
                      [](std::string const &address) { check(address); });
    }
    template <typename T>
    static void check(std::vector<T> const &values) {
        require(values.size() <= Https::listItemsMax, "a list has an end");
        for (T const &value : values) {
            check(value);
        }
    }
    static void check(StorageArray const &array) {
        check(array.id);
        check(array.name);
        check(array.vendorId);
        check(array.modelId);
        check(array.endpoints);
    }
    static void check(StorageContainer const &container) {
        checkId(container.id);
        check(container.name);
        checkAmount(container.maxLumoSizeMb);
        check(container.arrayIds);
    }
    static void check(VirtualVolume const &volume) {
        checkId(volume.uuid);
        checkId(volume.containerId);
        check(volume.directoryName);
        checkAmount(volume.sizeMb);
        checkAmount(volume.committedMb);
        checkAmount(volume.unsharedMb.value_or(0));
        check(volume.profile);
        checkAmount(volume.blockSize);
        check(volume.vmUuid);
        check(volume.boundTo);
    }
    static void check(ConfigVolume const &volume) {
        checkId(volume.uuid);
        check(volume.directoryName);
        check(volume.boundTo);
    }
    static void check(VolumePresence const &presence) {
        check(presence.boundTo);
    }
    static void check(std::optional<VirtualVolume> const &volume) {
        if (volume) {
            check(*volume);
        }
    }
    static void check(SpaceStats const &stats) {
        checkAmount(stats.logicalMb);
        checkAmount(stats.committedMb);
        checkAmount(stats.unsharedMb.value_or(0));
    }
    static void check(UnsharedChunks const &chunks) {
        checkAmount(chunks.blockSize);
        require(chunks.bitmap.size() <= Https::answerBytesMax, "a bitmap has an end");
    }
    static void check(MetadataPair const &pair) {
        check(pair.key);
        check(pair.value);
    }
    static void check(Done) {}
    template <typename T>
    static void check(Listing<T> const &listing) {
        require(listing.items != nullptr, "a list is there");
        check(*listing.items);
    }
};

template <typename T>
bool settle(Fuzz::World &world, kj::Promise<Outcome<T>> promise, kj::TimePoint deadline) {
    Outcome<T> const outcome = world.finish(kj::mv(promise));
    require(world.timer().now() <= deadline, "it ends by the deadline");
    if (outcome.ok()) {
        Checks::check(outcome.value());
    } else {
        Fuzz::requireFailure(outcome.failure());
        require(Plexa::isValidUtf8(outcome.failure().sentence()), "a sentence is UTF-8");
    }
    return outcome.ok();
}

constexpr char const *container = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
constexpr char const *volume = "11111111-2222-3333-4444-555555555555";

void ask(Fuzz::World &world, Provider &provider, unsigned which) {
    CallContext const context{world.timer().now() + 30 * kj::SECONDS, "context", which % 2 == 0 ? "key" : ""};
    auto const settled = [&](auto promise) { return settle(world, kj::mv(promise), context.deadline); };
    switch (which % 15) {
    case 0:
        // What is kept of the first answer has a part in the second.
        if (settled(provider.queryStorageArray(context))) {
            settled(provider.queryStorageArray(context));
        }
        break;
    case 1:
        if (settled(provider.queryStorageContainer(context))) {
            settled(provider.queryStorageContainer(context));
        }
        break;
    case 2:
        settled(provider.createVirtualVolume(context, {container, VolumeKind::Config, "directory", 1, "profile", ""}));
        break;
    case 3:
        settled(provider.deleteVirtualVolume(context, container, volume));
        break;
    case 4:
        settled(provider.bindVirtualVolume(context, container, volume, "endpoint"));
        break;
    case 5:
        settled(provider.unbindVirtualVolume(context, container, volume));
        break;
    case 6:
        settled(provider.queryVirtualVolume(context, container, volume));
        break;
    case 7:
        settled(provider.queryVirtualVolumesOfContainer(context, container, 3));
        break;
    case 8:
        settled(provider.queryVirtualVolumesById(context, container, {volume, container}));
        break;
    case 9:
        settled(provider.queryVirtualVolumeByDirectoryName(context, container, "directory"));
        break;
    case 10:
        settled(provider.queryVirtualVolumesBound(context));
        break;
    case 11:
        settled(provider.spaceStatsForVirtualVolume(context, container, volume));
        break;
    case 12:
        settled(provider.unsharedChunksVirtualVolume(context, container, volume));
        break;
    case 13:
        settled(provider.getMetadata(context, container, volume));
        break;
    default:
        settled(provider.setContext(context));
        break;
    }
}

} // namespace

namespace Orka::Https {

Trust::Trust(std::string const &, Url const &) {}

kj::Promise<kj::Own<kj::AsyncIoStream>> Trust::secure(kj::Own<kj::AsyncIoStream> stream) {
    return kj::mv(stream);
}

std::string Trust::advice() const {
    return "";
}

} // namespace Orka::Https

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    if (size == 0) {
        return 0;
    }
    Fuzz::World world;
    Network network(world.timer(), Fuzz::textOf(data + 1, size - 1));
    auto const provider = makeProvider("https://array.test:8443/orka", {world.timer(), nullptr, &network, ""});
    ask(world, *provider, data[0]);
    return 0;
}
