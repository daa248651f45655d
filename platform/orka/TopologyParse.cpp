// SPDX-License-Identifier: Apache-2.0
//
// From JSON to a Topology. Whatever an array file could not hold, or would make no sense in one, is refused here with
// the path of the member, so that writing the file afterwards can only fail for reasons of the disk.
#include <algorithm>
#include <limits>
#include <unordered_map>
#include <unordered_set>

#include <fmt/format.h>

#include "JsonReading.h"
#include "orka/Topology.h"
#include "wire/ContainerId.h"

namespace Orka {

namespace {

constexpr int64_t anySize = std::numeric_limits<int64_t>::max();
constexpr int64_t defaultVolumeSizeMb = 4096;
constexpr int64_t defaultBlockSize = int64_t{1} << 20;
constexpr int64_t leastBlockSize = 512;
constexpr int64_t mostBlockSize = int64_t{1} << 30;

class TopologyReader {
public:
    Topology read(JsonNode const &document) {
        JsonObject const object(document, {"description", "arrays", "containers"});
        // A description is for those who read the JSON; no array keeps it.
        object.textOr("description", "");
        object.at("arrays").each([&](JsonNode const &node) { readArray(node); });
        object.each("containers", [&](JsonNode const &node) { readContainer(node); });
        return std::move(topology_);
    }

private:
    /// Where a thing that others refer to stands in its list, by its id.
    using Places = std::unordered_map<std::string, size_t>;

    void readArray(JsonNode const &node);
    Endpoint readEndpoint(JsonNode const &node, std::string const &arrayId);
    void readTransport(JsonObject const &object, JsonNode const &type, Endpoint &endpoint);
    void readContainer(JsonNode const &node);
    void readVolume(JsonNode const &node, StorageContainer const &container);
    void readSizes(JsonObject const &object, StorageContainer const &container, VirtualVolume &volume);
    void readBinding(JsonObject const &object, StorageContainer const &container, VirtualVolume &volume);
    static std::string readUuid(JsonNode const &node);

    Topology topology_;
    Places arrays_;
    Places containers_;
    std::unordered_map<std::string, std::string> arrayOfEndpoint_;
    std::unordered_set<std::string> volumes_;
    /// Of the container that is being read.
    std::unordered_set<std::string> directoryNames_;
};

std::string TopologyReader::readUuid(JsonNode const &node) {
    auto const text = node.text();
    auto id = Wire::normalizeContainerId(text);
    if (!id) {
        node.fail("a UUID is expected, not " + quoted(text));
    }
    return *std::move(id);
}

void TopologyReader::readArray(JsonNode const &node) {
    JsonObject const object(node, {"id", "name", "vendorId", "modelId", "endpoints"});
    StorageArray array;
    auto const id = object.at("id");
    array.id = id.name();
    if (!arrays_.emplace(array.id, topology_.arrays.size()).second) {
        id.fail("another storage array has the id " + quoted(array.id));
    }
    array.name = object.textOr("name", "");
    array.vendorId = object.textOr("vendorId", "");
    array.modelId = object.textOr("modelId", "");
    object.each("endpoints",
                [&](JsonNode const &element) { array.endpoints.push_back(readEndpoint(element, array.id)); });
    topology_.arrays.push_back(std::move(array));
}

Endpoint TopologyReader::readEndpoint(JsonNode const &node, std::string const &arrayId) {
    JsonObject const object(
        node, {"uid", "type", "lunId", "ipAddress", "addresses", "serverMount", "accessible", "configured"});
    Endpoint endpoint;
    if (object.has("uid")) {
        auto const uid = object.at("uid");
        endpoint.uid = uid.name();
        if (!arrayOfEndpoint_.emplace(*endpoint.uid, arrayId).second) {
            uid.fail("another protocol endpoint has the uid " + quoted(*endpoint.uid));
        }
    }
    endpoint.isAccessible = object.booleanOr("accessible", true);
    endpoint.isConfigured = object.booleanOr("configured", true);
    readTransport(object, object.at("type"), endpoint);
    return endpoint;
}

void TopologyReader::readTransport(JsonObject const &object, JsonNode const &type, Endpoint &endpoint) {
    std::string word;
    std::vector<std::string_view> own;
    if (type.value().IsNumber()) {
        endpoint.type = static_cast<int32_t>(
            type.integer(std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()));
        if (endpoint.type >= 0 && endpoint.type <= 2) {
            type.fail("the transports 0, 1 and 2 have words: SCSI, NFS, NFS4x");
        }
        word = std::to_string(endpoint.type);
    } else {
        word = type.text();
        if (word == "SCSI") {
            endpoint.type = static_cast<int32_t>(TransportType::Scsi);
            own = {"lunId"};
            endpoint.text1 = object.optionalText("lunId");
        } else if (word == "NFS") {
            endpoint.type = static_cast<int32_t>(TransportType::Nfs);
            own = {"ipAddress", "serverMount"};
            endpoint.text1 = object.optionalText("ipAddress");
            endpoint.text2 = object.optionalText("serverMount");
        } else if (word == "NFS4x") {
            endpoint.type = static_cast<int32_t>(TransportType::Nfs4x);
            own = {"addresses", "serverMount"};
            endpoint.text1 = object.optionalText("serverMount");
            object.each("addresses",
                        [&](JsonNode const &element) { endpoint.nfs4xAddresses.push_back(element.text()); });
        } else {
            type.fail("SCSI, NFS, NFS4x or another transport's number is expected, not " + quoted(word));
        }
    }
    for (std::string_view const member : {"lunId", "ipAddress", "addresses", "serverMount"}) {
        if (object.has(member) && std::find(own.begin(), own.end(), member) == own.end()) {
            object.at(member).fail(fmt::format("an endpoint of type {} has no such member", word));
        }
    }
}

void TopologyReader::readContainer(JsonNode const &node) {
    JsonObject const object(node, {"id", "name", "maxLumoSizeMb", "arrays", "volumes"});
    StorageContainer container;
    auto const id = object.at("id");
    container.id = readUuid(id);
    if (!containers_.emplace(container.id, topology_.containers.size()).second) {
        id.fail("another storage container has the id " + container.id);
    }
    container.name = object.at("name").name();
    container.maxLumoSizeMb = object.at("maxLumoSizeMb").integer(1, anySize);
    object.each("arrays", [&](JsonNode const &element) {
        auto const array = element.text();
        if (arrays_.find(array) == arrays_.end()) {
            element.fail("there is no storage array with the id " + quoted(array));
        }
        if (std::find(container.arrayIds.begin(), container.arrayIds.end(), array) != container.arrayIds.end()) {
            element.fail("the storage array " + quoted(array) + " stands here twice");
        }
        container.arrayIds.push_back(array);
    });
    directoryNames_.clear();
    object.each("volumes", [&](JsonNode const &element) { readVolume(element, container); });
    topology_.containers.push_back(std::move(container));
}

void TopologyReader::readVolume(JsonNode const &node, StorageContainer const &container) {
    JsonObject const object(node, {"uuid", "kind", "directoryName", "sizeMb", "committedMb", "unsharedMb", "profile",
                                   "blockSize", "vmUuid", "boundTo", "metadata"});
    TopologyVolume made;
    auto &volume = made.volume;
    auto const uuid = object.at("uuid");
    volume.uuid = readUuid(uuid);
    if (!volumes_.insert(volume.uuid).second) {
        uuid.fail("another virtual volume has the id " + volume.uuid);
    }
    volume.containerId = container.id;
    auto const kind = object.textOr("kind", "config");
    if (kind != "config" && kind != "data") {
        object.at("kind").fail("config or data is expected, not " + quoted(kind));
    }
    volume.kind = kind == "config" ? VolumeKind::Config : VolumeKind::Data;
    if (volume.kind == VolumeKind::Config) {
        auto const directoryName = object.at("directoryName");
        volume.directoryName = directoryName.name();
        if (!directoryNames_.insert(volume.directoryName).second) {
            directoryName.fail("another virtual volume of the container has the directory name " +
                               quoted(volume.directoryName));
        }
    } else if (object.has("directoryName")) {
        object.at("directoryName").fail("a data volume has no directory name");
    }
    readSizes(object, container, volume);
    volume.profile = object.optionalText("profile");
    volume.vmUuid = object.textOr("vmUuid", "");
    readBinding(object, container, volume);
    object.each("metadata", [&](JsonNode const &element) {
        JsonObject const pair(element, {"key", "value"});
        made.metadata.push_back({pair.at("key").text(), pair.at("value").text()});
    });
    topology_.volumes.push_back(std::move(made));
}

void TopologyReader::readSizes(JsonObject const &object, StorageContainer const &container, VirtualVolume &volume) {
    auto const most = container.maxLumoSizeMb;
    volume.sizeMb = object.integerOr("sizeMb", 1, most, std::min(defaultVolumeSizeMb, most));
    volume.committedMb = object.integerOr("committedMb", 0, volume.sizeMb, 0);
    if (object.has("unsharedMb")) {
        volume.unsharedMb = object.at("unsharedMb").integer(0, volume.committedMb);
    }
    volume.blockSize = object.integerOr("blockSize", leastBlockSize, mostBlockSize, defaultBlockSize);
    if ((volume.blockSize & (volume.blockSize - 1)) != 0) {
        object.at("blockSize").fail(fmt::format("a power of two is expected, not {}", volume.blockSize));
    }
}

void TopologyReader::readBinding(JsonObject const &object, StorageContainer const &container, VirtualVolume &volume) {
    if (!object.has("boundTo")) {
        return;
    }
    auto const boundTo = object.at("boundTo");
    auto const uid = boundTo.name();
    auto const array = arrayOfEndpoint_.find(uid);
    if (array == arrayOfEndpoint_.end()) {
        boundTo.fail("there is no protocol endpoint with the uid " + quoted(uid));
    }
    if (std::find(container.arrayIds.begin(), container.arrayIds.end(), array->second) == container.arrayIds.end()) {
        boundTo.fail("the protocol endpoint " + quoted(uid) + " belongs to no storage array of this container");
    }
    volume.boundTo = uid;
}

} // namespace

Topology parseTopology(std::string_view json, std::string const &sourceName) {
    rapidjson::Document document;
    parseJson(json, sourceName, document);
    return TopologyReader().read(JsonNode(document, sourceName));
}

} // namespace Orka
