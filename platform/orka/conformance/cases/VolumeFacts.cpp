// SPDX-License-Identifier: Apache-2.0
//
// One volume: facts, space, chunks, metadata.
#include <bitset>
#include <numeric>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

constexpr int64_t bytesPerMb = int64_t{1} << 20;

/// How many chunks hold a volume, rounded up, and no more than an answer covers.
uint64_t chunksOf(VirtualVolume const &volume, int64_t blockSize) {
    auto const bytes = static_cast<__uint128_t>(volume.sizeMb) * bytesPerMb;
    auto const chunks = (bytes + static_cast<uint64_t>(blockSize) - 1) / static_cast<uint64_t>(blockSize);
    auto const most = static_cast<uint64_t>(UnsharedChunks::maxChunks);
    return chunks > most ? most : static_cast<uint64_t>(chunks);
}

VirtualVolume sized(Probe &probe, int64_t sizeMb) {
    auto spec = probe.freshSpec();
    spec.sizeMb = sizeMb;
    return probe.make(spec);
}

SpaceStats statsOf(Probe &probe, VirtualVolume const &volume) {
    return expectSuccess("space statistics", probe.ask(probe.provider().spaceStatsForVirtualVolume(
                                                 probe.context(), volume.containerId, volume.uuid)));
}

UnsharedChunks chunksIn(Probe &probe, VirtualVolume const &volume) {
    return expectSuccess("unshared chunks", probe.ask(probe.provider().unsharedChunksVirtualVolume(
                                                probe.context(), volume.containerId, volume.uuid)));
}

Metadata metadataOf(Probe &probe, VirtualVolume const &volume) {
    return expectSuccess("metadata",
                         probe.ask(probe.provider().getMetadata(probe.context(), volume.containerId, volume.uuid)));
}

/// What an array that is not empty holds already is looked at too: volumes with facts that a new one cannot have.
std::vector<VirtualVolume> someVolumes(Probe &probe) {
    constexpr size_t most = 20;
    std::vector<VirtualVolume> volumes{probe.make()};
    for (auto const &listed : probe.list(probe.containerId(), most)) {
        VirtualVolume known;
        known.containerId = probe.containerId();
        known.uuid = listed.uuid;
        volumes.push_back(probe.facts(known));
    }
    return volumes;
}

void followsChanges(Probe &probe) {
    auto const made = probe.make();
    expectEqual("what it is bound through, before", std::optional<std::string>(), probe.facts(made).boundTo);
    probe.bind(made, probe.ground().endpoint());
    expectEqual("what it is bound through", std::optional<std::string>(probe.ground().endpoint()),
                probe.facts(made).boundTo);
    probe.unbind(made);
    expectEqual("what it is bound through, after", std::optional<std::string>(), probe.facts(made).boundTo);
}

void followsOthersChanges(Probe &probe) {
    auto const made = probe.make();
    auto const other = probe.connect();
    auto const ask = [&] {
        return expectSuccess("its facts through another connection",
                             probe.ask(other->queryVirtualVolume(probe.context(), made.containerId, made.uuid)));
    };
    expectEqual("the volume, before", made, ask());
    probe.bind(made, probe.ground().endpoint());
    expectEqual("what it is bound through", std::optional<std::string>(probe.ground().endpoint()), ask().boundTo);
}

void statsAgreeWithFacts(Probe &probe) {
    for (auto const &volume : someVolumes(probe)) {
        SpaceStats const expected{volume.sizeMb, volume.committedMb, volume.unsharedMb};
        expectEqual("the space of " + show(volume), expected, statsOf(probe, volume));
    }
}

void sizesAreOrdered(Probe &probe) {
    for (auto const &volume : someVolumes(probe)) {
        auto const stats = statsOf(probe, volume);
        auto const unshared = stats.unsharedMb.value_or(0);
        expectTrue("0 <= unshared <= committed <= logical",
                   0 <= unshared && unshared <= stats.committedMb && stats.committedMb <= stats.logicalMb, show(stats));
    }
}

void chunksHaveTheBlockSize(Probe &probe) {
    for (auto const &volume : someVolumes(probe)) {
        expectEqual("the size of a chunk of " + show(volume), volume.blockSize, chunksIn(probe, volume).blockSize);
    }
}

void bitmapCovers(Probe &probe, std::vector<VirtualVolume> const &volumes) {
    for (auto const &volume : volumes) {
        auto const chunks = chunksIn(probe, volume);
        if (!volume.unsharedMb) {
            expectTrue("no bitmap where the array cannot tell", chunks.bitmap.empty(), show(chunks));
            continue;
        }
        auto const count = chunksOf(volume, chunks.blockSize);
        expectEqual("the bytes of the bitmap of " + show(volume), (count + 7) / 8, uint64_t{chunks.bitmap.size()});
        // Bits behind the last chunk stand for nothing.
        auto const tail = count % 8;
        expectTrue("no bit behind the last chunk", tail == 0 || (chunks.bitmap.back() >> tail) == 0, show(chunks));
    }
}

void bitmapCountsUnshared(Probe &probe) {
    for (auto const &volume : someVolumes(probe)) {
        auto const chunks = chunksIn(probe, volume);
        if (!volume.unsharedMb || chunksOf(volume, chunks.blockSize) == UnsharedChunks::maxChunks) {
            continue;
        }
        uint64_t set = 0;
        for (auto const byte : chunks.bitmap) {
            set += std::bitset<8>(byte).count();
        }
        auto const unshared = static_cast<uint64_t>(*volume.unsharedMb) * bytesPerMb;
        auto const block = static_cast<uint64_t>(chunks.blockSize);
        expectEqual("how many chunks of " + show(volume) + " are its own", (unshared + block - 1) / block, set);
    }
}

void directoryNamePair(Probe &probe) {
    auto const made = probe.make();
    Metadata const expected{{"directoryName", made.directoryName}};
    expectEqual("a new config volume's metadata", expected, metadataOf(probe, made));
}

void dataVolumeHasNone(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    expectEqual("a new data volume's metadata", Metadata{}, metadataOf(probe, probe.make(spec)));
}

void metadataKeepsOrder(Probe &probe) {
    for (auto const &volume : someVolumes(probe)) {
        auto const first = metadataOf(probe, volume);
        probe.reconnect();
        expectEqual("the same pairs again", first, metadataOf(probe, volume));
    }
}

void metadataIsUntouched(Probe &probe) {
    auto const made = probe.make();
    auto const before = metadataOf(probe, made);
    probe.bind(made, probe.ground().endpoint());
    probe.unbind(made);
    expectEqual("the pairs after binding and unbinding", before, metadataOf(probe, made));
}

} // namespace

Cases volumeFactCases() {
    return {
        {"volume/query/facts", "A volume's facts are the same each time.",
         [](Probe &probe) {
             auto const made = probe.make();
             expectEqual("its facts", made, probe.facts(made));
             expectEqual("its facts again", made, probe.facts(made));
         }},
        {"volume/query/follows-changes", "A volume's facts follow what happens to it.", followsChanges},
        {"volume/query/follows-others", "A volume's facts follow what other connections do to it.",
         followsOthersChanges},
        {"volume/query/wrong-container", "A volume is not found in a container that it is not in.",
         [](Probe &probe) {
             auto const made = probe.make();
             expectFailure("its facts in another container", Wire::ErrorCode::NoSuchVolume,
                           probe.ask(probe.provider().queryVirtualVolume(
                               probe.context(), probe.ground().otherContainer().id, made.uuid)));
         }},
    };
}

Cases spaceCases() {
    return {
        {"volume/space-stats/agree-with-facts", "Space statistics tell what the volume's facts tell, in MB.",
         statsAgreeWithFacts},
        {"volume/space-stats/ordered", "What is unshared is committed, and what is committed is in the volume.",
         sizesAreOrdered},
        {"volume/unshared-chunks/block-size", "A chunk has the volume's block size, in bytes.", chunksHaveTheBlockSize},
        {"volume/unshared-chunks/bitmap-length", "The bitmap has a bit for each chunk, and none set behind the last.",
         [](Probe &probe) { bitmapCovers(probe, someVolumes(probe)); }},
        {"volume/unshared-chunks/bitmap-of-odd-sizes", "The bitmap of 1, 7, 8, 9 and 4095 MB has the right length.",
         [](Probe &probe) {
             std::vector<VirtualVolume> volumes;
             for (auto const size : {1, 7, 8, 9, 4095}) {
                 if (size <= probe.ground().container().maxLumoSizeMb) {
                     volumes.push_back(sized(probe, size));
                 }
             }
             bitmapCovers(probe, volumes);
         }},
        {"volume/unshared-chunks/bitmap-of-largest", "The bitmap of the largest volume covers no more than it may.",
         [](Probe &probe) { bitmapCovers(probe, {sized(probe, probe.ground().container().maxLumoSizeMb)}); }},
        {"volume/unshared-chunks/as-many-as-told", "As many chunks are a volume's own as its facts tell.",
         bitmapCountsUnshared},
    };
}

Cases metadataCases() {
    return {
        {"volume/metadata/directory-name", "A new config volume has one pair, its name under \"directoryName\".",
         directoryNamePair},
        {"volume/metadata/data", "A new data volume has no metadata.", dataVolumeHasNone},
        {"volume/metadata/order", "Metadata comes in the same order each time.", metadataKeepsOrder},
        {"volume/metadata/untouched", "Binding and unbinding leave metadata as it was.", metadataIsUntouched},
    };
}

} // namespace Orka::Conformance
