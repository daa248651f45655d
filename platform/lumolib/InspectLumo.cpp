// SPDX-License-Identifier: Apache-2.0
//
// What the daemon knows about one volume: sizes, storage profile, unshared chunks, metadata.
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>

#include "Arena.h"
#include "Session.h"

using namespace LumoClient;

namespace {

/// The one-reply answer to a question about a volume.
template <typename Init, typename Take>
void inspect(Connection &connection, char const *containerId, char const *uuid, Init init, Take take) {
    std::string const canonical = canonicalContainerId(containerId);
    connection.request(
        Repeat::Always, connection.deadline(),
        [&](Compact::Request::Builder request) {
            Compact::VolumeKey::Builder key = init(request);
            key.setContainerId(canonical);
            key.setUuid(argument(uuid));
        },
        [&](Compact::Reply::Reader reply) { take(reply); });
}

void requireKind(Connection const &connection, bool right, char const *kind) {
    if (!right) {
        throw connection.unexpected(std::string("it answered something else than ") + kind);
    }
}

void requireNotNegative(Connection const &connection, std::int64_t size, char const *what) {
    if (size < 0) {
        throw connection.unexpected(std::string(what) + " is negative");
    }
}

} // namespace

int32_t LumoLib_SpaceStatsForLumo(char const *containerId, char const *uuid, LumoSpaceStats **stats) {
    return answer([=](Connection &connection) {
        requireOut(stats);
        auto owned = std::make_unique<LumoSpaceStats>();
        inspect(
            connection, containerId, uuid,
            [](Compact::Request::Builder request) { return request.initSpaceStatsForLumo(); },
            [&](Compact::Reply::Reader reply) {
                requireKind(connection, reply.isSpaceStats(), "space statistics");
                Compact::SpaceStats::Reader const answered = reply.getSpaceStats();
                owned->logicalSize = answered.getLogicalSizeMb();
                owned->committedSize = answered.getCommittedSizeMb();
                owned->unsharedSize = answered.getUnsharedSizeMb();
                owned->unsharedSizeValid = answered.getUnsharedSizeValid() ? 1 : 0;
            });
        requireNotNegative(connection, owned->logicalSize, "the logical size");
        requireNotNegative(connection, owned->committedSize, "the committed size");
        if (owned->unsharedSizeValid != 0) {
            requireNotNegative(connection, owned->unsharedSize, "the unshared size");
        }
        *stats = owned.release();
    });
}

void LumoLib_FreeLumoSpaceStatsInfo(LumoSpaceStats *stats) {
    delete stats;
}

int32_t LumoLib_GetLumoInfo(char const *containerId, char const *uuid, LumoInfo **info) {
    return answer([=](Connection &connection) {
        requireOut(info);
        auto owned = std::make_unique<Owned<LumoInfo>>();
        inspect(
            connection, containerId, uuid, [](Compact::Request::Builder request) { return request.initGetLumoInfo(); },
            [&](Compact::Reply::Reader reply) {
                requireKind(connection, reply.isLumoInfo(), "volume information");
                Compact::LumoInfo::Reader const answered = reply.getLumoInfo();
                if (answered.hasStorageProfile()) {
                    owned->storageProfile = owned->arena.copy(answered.getStorageProfile());
                }
            });
        *info = owned.release();
    });
}

void LumoLib_FreeLumoInfo(LumoInfo *info) {
    Owned<LumoInfo>::free(info);
}

int32_t LumoLib_UnsharedChunksLumo(char const *containerId, char const *uuid, int, int, int, int, int,
                                   LumoUnsharedChunks **chunks) {
    return answer([=](Connection &connection) {
        requireOut(chunks);
        // One block, because the caller releases it with free().
        std::unique_ptr<LumoUnsharedChunks, decltype(&std::free)> block(nullptr, &std::free);
        inspect(
            connection, containerId, uuid,
            [](Compact::Request::Builder request) { return request.initUnsharedChunksLumo(); },
            [&](Compact::Reply::Reader reply) {
                requireKind(connection, reply.isUnsharedChunks(), "unshared chunks");
                Compact::UnsharedChunks::Reader const answered = reply.getUnsharedChunks();
                std::span<std::uint8_t const> const bitmap = answered.getBitmap();
                void *room = std::malloc(sizeof(LumoUnsharedChunks) + bitmap.size());
                if (room == nullptr) {
                    throw std::bad_alloc();
                }
                block.reset(new (room) LumoUnsharedChunks{answered.getBlockSize(),
                                                          static_cast<std::int64_t>(bitmap.size()) * 8});
                if (!bitmap.empty()) {
                    std::memcpy(block.get() + 1, bitmap.data(), bitmap.size());
                }
            });
        requireNotNegative(connection, block->blockSize, "the block size");
        *chunks = block.release();
    });
}

int32_t LumoLib_GetLumoMetadata(char const *containerId, char const *uuid, LumoMetadata **metadata) {
    return answer([=](Connection &connection) {
        requireOut(metadata);
        auto owned = std::make_unique<Owned<LumoMetadata>>();
        LumoMetadataEntry **end = &owned->first;
        inspect(
            connection, containerId, uuid,
            [](Compact::Request::Builder request) { return request.initGetLumoMetadata(); },
            [&](Compact::Reply::Reader reply) {
                requireKind(connection, reply.isMetadata() || reply.isDone(), "metadata");
                if (reply.isDone()) {
                    return;
                }
                Compact::List<Compact::MetadataPair>::Reader const pairs = reply.getMetadata();
                connection.requireChunk(pairs.size());
                for (Compact::MetadataPair::Reader const pair : pairs) {
                    auto *entry = owned->arena.records<LumoMetadataEntry>(1);
                    entry->key = owned->arena.copy(pair.getKey());
                    entry->value = owned->arena.copy(pair.getValue());
                    *end = entry;
                    end = &entry->next;
                }
            });
        owned->arena.trim();
        *metadata = owned.release();
    });
}

void LumoLib_FreeLumoMetadata(LumoMetadata *metadata) {
    Owned<LumoMetadata>::free(metadata);
}
