// SPDX-License-Identifier: Apache-2.0
//
// What goes over the line, as values, and the one declaration of how each is called there. Client and server read and
// write bodies by these fields() functions and no others, and a test holds the published description against them.
//
// A visitor has a method for each kind of member:
//   text       any text                      name     a text that is not empty
//   uuid       a UUID; read in any spelling, canonical once read
//   amount     a whole number from 0         number   any whole number
//   flag       true or false                 kind     "config" or "data"
//   bytes      base64                        texts    a list of texts
//   list       of structures                 structure
// A member whose C++ type is std::optional may be absent or null; every other must be there.
#pragma once

#include <concepts>
#include <cstdint>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

#include "orka/Model.h"

namespace Orka::Https {

/// What every request carries besides its own members.
struct Envelope {
    std::optional<std::string> orkaContext;
    std::optional<std::string> idempotencyKey;
    std::optional<int64_t> timeoutMs;
};

struct ListRequest {
    static constexpr char const *schemaName = "ListRequest";
    std::optional<std::string> knownVersion;
    std::optional<std::string> page;
    std::optional<int64_t> pageSize;
};
struct BoundVolumesRequest {
    static constexpr char const *schemaName = "BoundVolumesRequest";
    std::optional<std::string> page;
    std::optional<int64_t> pageSize;
};
struct VolumesOfContainerRequest {
    static constexpr char const *schemaName = "VolumesOfContainerRequest";
    std::string containerId;
    int64_t max = 0;
    std::optional<std::string> page;
    std::optional<int64_t> pageSize;
};
struct CreateRequest {
    static constexpr char const *schemaName = "CreateRequest";
    VolumeSpec spec;
};
struct VolumeRequest {
    static constexpr char const *schemaName = "VolumeRequest";
    std::string containerId;
    std::string uuid;
};
struct BindRequest {
    static constexpr char const *schemaName = "BindRequest";
    std::string containerId;
    std::string uuid;
    std::string endpointUid;
};
struct VolumesByIdRequest {
    static constexpr char const *schemaName = "VolumesByIdRequest";
    std::string containerId;
    std::vector<std::string> uuids;
};
struct VolumeByDirectoryNameRequest {
    static constexpr char const *schemaName = "VolumeByDirectoryNameRequest";
    std::string containerId;
    std::string directoryName;
};
struct ContextRequest {
    static constexpr char const *schemaName = "ContextRequest";
};

/// A list that the provider keeps: with a version, and empty when the client has that version already.
template <typename T>
struct ListAnswer {
    std::string version;
    bool unchanged = false;
    std::vector<T> items;
    std::optional<std::string> nextPage;
};
/// A list that is made for the one who asks.
template <typename T>
struct PageAnswer {
    std::vector<T> items;
    std::optional<std::string> nextPage;
};
template <typename T>
struct ItemsAnswer {
    std::vector<T> items;
};
struct MaybeVolumeAnswer {
    std::optional<VirtualVolume> volume;
};
struct DoneAnswer {};

struct ErrorBody {
    std::string code;
    std::string message;
};
struct ErrorAnswer {
    ErrorBody error;
};

template <typename Object, typename T>
concept Is = std::same_as<std::remove_const_t<Object>, T>;

template <typename Visitor, Is<Envelope> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("orkaContext", object.orkaContext);
    visit.text("idempotencyKey", object.idempotencyKey);
    visit.amount("timeoutMs", object.timeoutMs);
}

template <typename Visitor, Is<ListRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("knownVersion", object.knownVersion);
    visit.text("page", object.page);
    visit.amount("pageSize", object.pageSize);
}

template <typename Visitor, Is<BoundVolumesRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("page", object.page);
    visit.amount("pageSize", object.pageSize);
}

template <typename Visitor, Is<VolumesOfContainerRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.containerId);
    visit.number("max", object.max);
    visit.text("page", object.page);
    visit.amount("pageSize", object.pageSize);
}

template <typename Visitor, Is<CreateRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.spec.containerId);
    visit.kind("kind", object.spec.kind);
    visit.text("directoryName", object.spec.directoryName);
    visit.number("sizeMb", object.spec.sizeMb);
    visit.text("profile", object.spec.profile);
    visit.text("vmUuid", object.spec.vmUuid);
}

template <typename Visitor, Is<VolumeRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.containerId);
    visit.text("uuid", object.uuid);
}

template <typename Visitor, Is<BindRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.containerId);
    visit.text("uuid", object.uuid);
    visit.text("endpointUid", object.endpointUid);
}

template <typename Visitor, Is<VolumesByIdRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.containerId);
    visit.texts("uuids", object.uuids);
}

template <typename Visitor, Is<VolumeByDirectoryNameRequest> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("containerId", object.containerId);
    visit.text("directoryName", object.directoryName);
}

template <typename Visitor, Is<ContextRequest> Object>
void fields(Visitor &, Object &) {}

template <typename Visitor, Is<Endpoint> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("uid", object.uid);
    visit.number("type", object.type);
    visit.text("text1", object.text1);
    visit.text("text2", object.text2);
    visit.texts("nfs4xAddresses", object.nfs4xAddresses);
    visit.flag("isAccessible", object.isAccessible);
    visit.flag("isConfigured", object.isConfigured);
}

template <typename Visitor, Is<StorageArray> Object>
void fields(Visitor &visit, Object &object) {
    visit.name("id", object.id);
    visit.text("name", object.name);
    visit.text("vendorId", object.vendorId);
    visit.text("modelId", object.modelId);
    visit.list("endpoints", object.endpoints);
}

template <typename Visitor, Is<StorageContainer> Object>
void fields(Visitor &visit, Object &object) {
    visit.uuid("id", object.id);
    visit.text("name", object.name);
    visit.amount("maxLumoSizeMb", object.maxLumoSizeMb);
    visit.texts("arrayIds", object.arrayIds);
}

template <typename Visitor, Is<VirtualVolume> Object>
void fields(Visitor &visit, Object &object) {
    visit.uuid("uuid", object.uuid);
    visit.uuid("containerId", object.containerId);
    visit.kind("kind", object.kind);
    visit.text("directoryName", object.directoryName);
    visit.amount("sizeMb", object.sizeMb);
    visit.amount("committedMb", object.committedMb);
    visit.amount("unsharedMb", object.unsharedMb);
    visit.text("profile", object.profile);
    visit.amount("blockSize", object.blockSize);
    visit.text("vmUuid", object.vmUuid);
    visit.text("boundTo", object.boundTo);
}

template <typename Visitor, Is<ConfigVolume> Object>
void fields(Visitor &visit, Object &object) {
    visit.uuid("uuid", object.uuid);
    visit.text("directoryName", object.directoryName);
    visit.text("boundTo", object.boundTo);
}

template <typename Visitor, Is<VolumePresence> Object>
void fields(Visitor &visit, Object &object) {
    visit.flag("exists", object.exists);
    visit.text("boundTo", object.boundTo);
}

template <typename Visitor, Is<MetadataPair> Object>
void fields(Visitor &visit, Object &object) {
    visit.text("key", object.key);
    visit.text("value", object.value);
}

template <typename Visitor, Is<SpaceStats> Object>
void fields(Visitor &visit, Object &object) {
    visit.amount("logicalMb", object.logicalMb);
    visit.amount("committedMb", object.committedMb);
    visit.amount("unsharedMb", object.unsharedMb);
}

template <typename Visitor, Is<UnsharedChunks> Object>
void fields(Visitor &visit, Object &object) {
    visit.amount("blockSize", object.blockSize);
    visit.bytes("bitmap", object.bitmap);
}

template <typename Visitor, typename T>
void listFields(Visitor &visit, T &object) {
    visit.name("version", object.version);
    visit.flag("unchanged", object.unchanged);
    visit.list("items", object.items);
    visit.text("nextPage", object.nextPage);
}
template <typename Visitor, typename T>
void fields(Visitor &visit, ListAnswer<T> &object) {
    listFields(visit, object);
}
template <typename Visitor, typename T>
void fields(Visitor &visit, ListAnswer<T> const &object) {
    listFields(visit, object);
}

template <typename Visitor, typename T>
void pageFields(Visitor &visit, T &object) {
    visit.list("items", object.items);
    visit.text("nextPage", object.nextPage);
}
template <typename Visitor, typename T>
void fields(Visitor &visit, PageAnswer<T> &object) {
    pageFields(visit, object);
}
template <typename Visitor, typename T>
void fields(Visitor &visit, PageAnswer<T> const &object) {
    pageFields(visit, object);
}

template <typename Visitor, typename T>
void fields(Visitor &visit, ItemsAnswer<T> &object) {
    visit.list("items", object.items);
}
template <typename Visitor, typename T>
void fields(Visitor &visit, ItemsAnswer<T> const &object) {
    visit.list("items", object.items);
}

template <typename Visitor, Is<MaybeVolumeAnswer> Object>
void fields(Visitor &visit, Object &object) {
    visit.structure("volume", object.volume);
}

template <typename Visitor, Is<DoneAnswer> Object>
void fields(Visitor &, Object &) {}

template <typename Visitor, Is<ErrorBody> Object>
void fields(Visitor &visit, Object &object) {
    visit.name("code", object.code);
    visit.text("message", object.message);
}

template <typename Visitor, Is<ErrorAnswer> Object>
void fields(Visitor &visit, Object &object) {
    visit.structure("error", object.error);
}

} // namespace Orka::Https
