// SPDX-License-Identifier: Apache-2.0
#include <fmt/format.h>

#include "Seeds.h"
#include "https/BodyWriter.h"
#include "https/Protocol.h"

namespace Fuzz {

namespace {

using namespace Orka;
using namespace Orka::Https;

constexpr char const *container = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
constexpr char const *volume = "11111111-2222-3333-4444-555555555555";

std::string post(std::string_view operation, std::string const &body) {
    return fmt::format("POST /orka{}{} HTTP/1.1\r\nHost: a\r\nContent-Type: {}\r\nContent-Length: {}\r\n\r\n{}",
                       versionSegment, operation, jsonType, body.size(), body);
}

} // namespace

void makeProviderRequestSeeds(Keep const &keep) {
    std::string all;
    auto const put = [&](std::string_view name, std::string_view operation, auto const &request) {
        std::string const bytes = post(operation, bodyOf(Envelope{"context", std::string(name), 5000}, request));
        keep(name, bytes);
        all += bytes;
    };
    put("arrays", "queryStorageArray", ListRequest{"instance-1", std::nullopt, 1});
    put("containers", "queryStorageContainer", ListRequest{std::nullopt, std::nullopt, 1});
    put("second_page", "queryStorageContainer", ListRequest{std::nullopt, "instance-1.1", 1});
    put("create", "createVirtualVolume", CreateRequest{{container, VolumeKind::Config, "new", 7, "profile", "vm"}});
    put("delete", "deleteVirtualVolume", VolumeRequest{container, volume});
    put("bind", "bindVirtualVolume", BindRequest{container, volume, "endpoint"});
    put("unbind", "unbindVirtualVolume", VolumeRequest{container, volume});
    put("volume", "queryVirtualVolume", VolumeRequest{container, volume});
    put("config_volumes", "queryVirtualVolumesOfContainer",
        VolumesOfContainerRequest{container, 3, std::nullopt, std::nullopt});
    put("presence", "queryVirtualVolumesById", VolumesByIdRequest{container, {volume, container}});
    put("volume_by_name", "queryVirtualVolumeByDirectoryName", VolumeByDirectoryNameRequest{container, "directory"});
    put("bound_volumes", "queryVirtualVolumesBound", BoundVolumesRequest{});
    put("space_stats", "spaceStatsForVirtualVolume", VolumeRequest{container, volume});
    put("unshared_chunks", "unsharedChunksVirtualVolume", VolumeRequest{container, volume});
    put("metadata", "getMetadata", VolumeRequest{container, volume});
    put("context", "setContext", ContextRequest{});
    keep("one_after_the_other", all);
    keep("get", "GET /orka/v1/queryStorageArray HTTP/1.1\r\nHost: a\r\n\r\n");
}

} // namespace Fuzz
