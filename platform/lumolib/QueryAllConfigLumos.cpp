// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstddef>
#include <memory>
#include <new>
#include <vector>

#include "Arena.h"
#include "Session.h"

using namespace LumoClient;

namespace {

/// The result ends in as many pointers as there are volumes, so it lies in its own arena, behind the address of that.
struct Head {
    Arena *arena;
    LumoQueryResult result;
};

LumoQueryResult *lay(std::unique_ptr<Arena> arena, std::vector<LumoQueryEntry> const &entries) {
    auto *records = arena->records<LumoQueryEntry>(entries.size());
    std::size_t const bytes = sizeof(Head) + entries.size() * sizeof(LumoQueryEntry *);
    auto *head = new (arena->allocate(bytes, alignof(Head))) Head{};
    for (std::size_t place = 0; place < entries.size(); ++place) {
        records[place] = entries[place];
        head->result.entries[place] = &records[place];
    }
    head->result.count = static_cast<std::int32_t>(entries.size());
    arena->trim();
    head->arena = arena.release();
    return &head->result;
}

} // namespace

int32_t LumoLib_QueryAllConfigLumos(char const *containerId, int32_t max, int32_t, LumoQueryResult **result, int32_t) {
    return answer([=](Connection &connection) {
        requireOut(result);
        std::string const canonical = canonicalContainerId(containerId);
        auto arena = std::make_unique<Arena>();
        std::vector<LumoQueryEntry> entries;
        auto const limit = static_cast<std::size_t>(std::max(max, 0));
        connection.request(
            Repeat::Always, connection.deadline(),
            [&](Compact::Request::Builder request) {
                Compact::QueryAllConfigLumos::Builder query = request.initQueryAllConfigLumos();
                query.setContainerId(canonical);
                query.setMax(std::max(max, 0));
            },
            [&](Compact::Reply::Reader reply) {
                if (reply.isDone()) {
                    return;
                }
                if (!reply.isConfigLumos()) {
                    throw connection.unexpected("it answered something else than config volumes");
                }
                Compact::List<Compact::ConfigLumo>::Reader const lumos = reply.getConfigLumos();
                connection.requireChunk(lumos.size());
                for (Compact::ConfigLumo::Reader const lumo : lumos) {
                    if (entries.size() == limit) {
                        break; // a daemon that tells more than it was asked for
                    }
                    entries.push_back({arena->copy(lumo.getUuid()), arena->copy(lumo.getDirectoryName())});
                }
            });
        *result = lay(std::move(arena), entries);
    });
}

void LumoLib_FreeQueryResult(LumoQueryResult *result) {
    if (result != nullptr) {
        auto *head = reinterpret_cast<Head *>(reinterpret_cast<std::byte *>(result) - offsetof(Head, result));
        delete head->arena;
    }
}
