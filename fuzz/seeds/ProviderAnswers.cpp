// SPDX-License-Identifier: Apache-2.0
#include <fmt/format.h>

#include "Seeds.h"
#include "https/BodyWriter.h"
#include "https/Protocol.h"

namespace Fuzz {

namespace {

using namespace Orka;
using namespace Orka::Https;

constexpr char const *id = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";

std::string response(unsigned status, std::string const &body) {
    return fmt::format("HTTP/1.1 {} So\r\nContent-Type: {}\r\nContent-Length: {}\r\n\r\n{}", status, jsonType,
                       body.size(), body);
}

template <typename T>
std::string done(T const &answer) {
    return response(statusDone, bodyOf(answer));
}

StorageArray someArray() {
    return {"array",
            "name",
            "vendor",
            "model",
            {{"endpoint", 0, "lun", std::nullopt, {}, true, true},
             {std::nullopt, 2, "mount", std::nullopt, {"10.0.0.1"}, false, true}}};
}

VirtualVolume someVolume() {
    VirtualVolume volume;
    volume.uuid = volume.containerId = id;
    volume.directoryName = "directory";
    volume.sizeMb = 8;
    volume.committedMb = 4;
    volume.unsharedMb = 2;
    volume.profile = "profile";
    volume.blockSize = 512;
    volume.boundTo = "endpoint";
    return volume;
}

} // namespace

void makeProviderAnswerSeeds(Keep const &keep) {
    auto const put = [&](char const *name, unsigned operation, std::string const &answers) {
        keep(name, std::string(1, static_cast<char>(operation)) + answers);
    };
    ListAnswer<StorageArray> const arrays{"1", false, {someArray()}, std::nullopt};
    ListAnswer<StorageArray> const unchanged{"1", true, {}, std::nullopt};
    put("arrays", 0, done(arrays) + done(unchanged));
    ListAnswer<StorageContainer> page{"1", false, {{id, "gold", 4096, {"array"}}}, "token.1"};
    ListAnswer<StorageContainer> const last{"1", false, {{id, "silver", 4096, {}}}, std::nullopt};
    put("containers_in_pages", 1, done(page) + done(last));
    put("created", 2, done(someVolume()));
    put("deleted", 3, done(DoneAnswer()));
    put("bound", 4, response(statusConflict, bodyOf(ErrorAnswer{{"inUse", "it is bound"}})));
    put("overloaded", 4, response(statusUnavailable, bodyOf(ErrorAnswer{{"busy", ""}})));
    put("redirected", 5, "HTTP/1.1 302 Found\r\nLocation: https://elsewhere/\r\n\r\n");
    put("volume", 6, done(someVolume()));
    put("config_volumes", 7, done(PageAnswer<ConfigVolume>{{{id, "directory", std::nullopt}}, std::nullopt}));
    put("stale_page", 7,
        done(PageAnswer<ConfigVolume>{{{id, "directory", "endpoint"}}, "token.1"}) +
            response(statusConflict, bodyOf(ErrorAnswer{{std::string(stalePage), "begin anew"}})));
    put("presence", 8, done(ItemsAnswer<VolumePresence>{{{true, "endpoint"}, {false, std::nullopt}}}));
    put("volume_by_name", 9, done(MaybeVolumeAnswer{someVolume()}));
    put("no_volume_by_name", 9, done(MaybeVolumeAnswer{}));
    put("bound_volumes", 10, done(PageAnswer<VirtualVolume>{{someVolume()}, std::nullopt}));
    put("space_stats", 11, done(SpaceStats{8, 4, 2}));
    put("unshared_chunks", 12, done(UnsharedChunks{512, {1, 2, 3}}));
    put("metadata", 13, done(ItemsAnswer<MetadataPair>{{{"key", "value"}, {"key", ""}}}));
    put("context", 14, done(DoneAnswer()));
    put("chunked", 14,
        "HTTP/1.1 200 OK\r\nContent-Type: application/json\r\nTransfer-Encoding: chunked\r\n\r\n2\r\n{}\r\n0\r\n\r\n");
}

} // namespace Fuzz
