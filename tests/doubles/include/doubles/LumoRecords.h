// SPDX-License-Identifier: Apache-2.0
//
// The daemon client library's records, made from plain values. A test writes what the daemon is to know; the records
// live as long as the LumoRecords that made them. A text that is not set becomes a null pointer.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "lumolib/LumoLib.h"

namespace Doubles {

using Text = std::optional<std::string>;

struct Transport {
    int32_t type = EndpointTransportScsi;
    Text text1;
    Text text2;
};

struct Endpoint {
    Text localUid;
    bool isAccessible = false;
    bool isConfigured = false;
    /// Not set: a null pointer.
    std::optional<Transport> transport;
    std::vector<Text> nfs4xAddresses;
};

struct StorageArray {
    Text arrayId;
    Text name;
    Text vendorId;
    Text modelId;
    std::vector<Endpoint> endpoints;
};

struct Container {
    Text name;
    Text id;
    Text providerUrl;
    int64_t maxLumoSizeMb = 0;
    std::vector<StorageArray> arrays;
};

class LumoRecords {
public:
    StorageContainerResult *containers(std::vector<Container> const &containers);
    LumoQueryResult *query(std::vector<Text> const &ids);
    /// A result whose count says something else than it holds entries.
    LumoQueryResult *queryWithCount(int32_t count);
    LumoSpaceStats *spaceStats(int64_t logical, int64_t committed, int64_t unshared, uint8_t valid);
    LumoInfo *info(Text const &storageProfile);
    LumoMetadata *metadata(std::vector<std::pair<Text, Text>> const &pairs);
    /// A copy of the text that outlives the call; null for none.
    char const *text(Text const &text);

private:
    template <class T>
    T *keep(T value) {
        auto const kept = std::make_shared<T>(std::move(value));
        kept_.push_back(kept);
        return kept.get();
    }
    ProtocolEndpointInfo *endpoint(Endpoint const &endpoint);
    StorageArrayInfo *array(StorageArray const &array);
    StorageContainerInfo *container(Container const &container);

    std::vector<std::shared_ptr<void>> kept_;
};

} // namespace Doubles
