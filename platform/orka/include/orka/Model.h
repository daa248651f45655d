// SPDX-License-Identifier: Apache-2.0
//
// What storage arrays hold, as plain values: the nouns that the array file stores, that a provider answers with and
// that the daemon passes on. A value says what the array told, no more; a text that the array did not tell is empty in
// the sense of std::optional, which is not the same as an empty text.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Orka {

/// What transports are known. An endpoint carries a plain number, since an array may tell one that is not listed here.
enum class TransportType : int32_t { Scsi = 0, Nfs = 1, Nfs4x = 2 };

/// A protocol endpoint: the door through which a host reaches the volumes that are bound to it.
struct Endpoint {
    std::optional<std::string> uid;   ///< unique within a provider; nothing can be bound to an endpoint without one
    int32_t type = 0;                 ///< a TransportType, or a number that we do not know
    std::optional<std::string> text1; ///< SCSI: the lunID; NFS: the ipAddress; NFS4x: the serverMount
    std::optional<std::string> text2; ///< NFS: the serverMount
    std::vector<std::string> nfs4xAddresses;
    bool isAccessible = false;
    bool isConfigured = false;

    bool operator==(Endpoint const &) const = default;
};

struct StorageArray {
    std::string id;
    std::string name;
    std::string vendorId;
    std::string modelId;
    std::vector<Endpoint> endpoints;

    bool operator==(StorageArray const &) const = default;
};

struct StorageContainer {
    std::string id; ///< canonical: 36 characters, lower case
    std::string name;
    int64_t maxLumoSizeMb = 0;
    std::vector<std::string> arrayIds; ///< the arrays that hold it, in the provider's order

    bool operator==(StorageContainer const &) const = default;
};

enum class VolumeKind : int32_t { Config = 0, Data = 1 };

struct VirtualVolume {
    std::string uuid; ///< canonical: 36 characters, lower case
    std::string containerId;
    VolumeKind kind = VolumeKind::Config;
    std::string directoryName; ///< unique within the container; empty for a volume that is no directory
    int64_t sizeMb = 0;
    int64_t committedMb = 0;
    std::optional<int64_t> unsharedMb; ///< nothing: the array cannot tell, the size is not valid
    std::optional<std::string> profile;
    int64_t blockSize = 0;              ///< bytes
    std::string vmUuid;                 ///< empty when no virtual machine is named
    std::optional<std::string> boundTo; ///< uid of the endpoint that it is bound through

    bool operator==(VirtualVolume const &) const = default;
};

struct MetadataPair {
    std::string key;
    std::string value;

    bool operator==(MetadataPair const &) const = default;
};

/// Pairs in the array's order; a key may occur more than once.
using Metadata = std::vector<MetadataPair>;

/// What createVirtualVolume asks for.
struct VolumeSpec {
    std::string containerId; ///< canonical
    VolumeKind kind = VolumeKind::Config;
    std::string directoryName;
    int64_t sizeMb = 0; ///< 0: the array's default (4096, or the container's maximum when that is smaller)
    std::optional<std::string> profile; ///< stored as it is
    std::string vmUuid;

    bool operator==(VolumeSpec const &) const = default;
};

/// A config volume in a list.
struct ConfigVolume {
    std::string uuid;
    std::string directoryName;
    std::optional<std::string> boundTo;

    bool operator==(ConfigVolume const &) const = default;
};

/// What an array knows of an id that it was asked about.
struct VolumePresence {
    bool exists = false;
    std::optional<std::string> boundTo;

    bool operator==(VolumePresence const &) const = default;
};

struct SpaceStats {
    int64_t logicalMb = 0;
    int64_t committedMb = 0;
    std::optional<int64_t> unsharedMb;

    bool operator==(SpaceStats const &) const = default;
};

/// Which chunks of a volume are its own. Bit n (bit n % 8 of byte n / 8) stands for the n-th chunk of blockSize bytes,
/// counted from the volume's start. An array that cannot tell what is shared answers without a bitmap, and no answer
/// covers more than maxChunks.
struct UnsharedChunks {
    static constexpr int64_t maxChunks = int64_t{1} << 23;

    int64_t blockSize = 0; ///< bytes
    std::vector<uint8_t> bitmap;

    bool operator==(UnsharedChunks const &) const = default;
};

} // namespace Orka
