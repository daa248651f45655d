// SPDX-License-Identifier: Apache-2.0
#include "doubles/LumoRecords.h"

#include <cstddef>

namespace Doubles {

char const *LumoRecords::text(Text const &text) {
    return text ? keep(std::string(*text))->c_str() : nullptr;
}

ProtocolEndpointInfo *LumoRecords::endpoint(Endpoint const &endpoint) {
    ProtocolEndpointInfo record = {};
    record.localUID = text(endpoint.localUid);
    std::vector<char const *> addresses;
    for (Text const &address : endpoint.nfs4xAddresses) {
        addresses.push_back(text(address));
    }
    record.nfs4xAddressCount = static_cast<int32_t>(addresses.size());
    record.nfs4xAddresses = keep(std::move(addresses))->data();
    if (endpoint.transport) {
        record.transport = keep(EndpointTransportInfo{endpoint.transport->type, text(endpoint.transport->text1),
                                                      text(endpoint.transport->text2)});
    }
    // Any value but 0 is true: the records do not hold booleans.
    record.isAccessible = endpoint.isAccessible ? 0x80 : 0;
    record.isConfigured = endpoint.isConfigured ? 0x80 : 0;
    return keep(record);
}

StorageArrayInfo *LumoRecords::array(StorageArray const &array) {
    StorageArrayInfo record = {};
    record.arrayId = text(array.arrayId);
    record.name = text(array.name);
    record.vendorId = text(array.vendorId);
    record.modelId = text(array.modelId);
    std::vector<ProtocolEndpointInfo *> endpoints;
    for (Endpoint const &each : array.endpoints) {
        endpoints.push_back(endpoint(each));
    }
    record.endpointCount = static_cast<int32_t>(endpoints.size());
    record.endpoints = keep(std::move(endpoints))->data();
    return keep(record);
}

StorageContainerInfo *LumoRecords::container(Container const &container) {
    StorageContainerInfo record = {};
    record.name = text(container.name);
    record.providerUrl = text(container.providerUrl);
    record.id = text(container.id);
    record.maxLumoSizeMb = container.maxLumoSizeMb;
    record.reserved = 0xDEADBEEF;
    std::vector<StorageArrayInfo *> arrays;
    for (StorageArray const &each : container.arrays) {
        arrays.push_back(array(each));
    }
    record.arrayCount = static_cast<int32_t>(arrays.size());
    record.arrays = keep(std::move(arrays))->data();
    return keep(record);
}

StorageContainerResult *LumoRecords::containers(std::vector<Container> const &containers) {
    std::vector<StorageContainerInfo *> records;
    for (Container const &each : containers) {
        records.push_back(container(each));
    }
    auto const count = static_cast<uint32_t>(records.size());
    return keep(StorageContainerResult{count, keep(std::move(records))->data()});
}

LumoQueryResult *LumoRecords::query(std::vector<Text> const &ids) {
    // The entries follow the count inline, so that the record is as long as there are ids.
    std::size_t const size = offsetof(LumoQueryResult, entries) + (ids.size() + 1) * sizeof(LumoQueryEntry *);
    auto *const storage = keep(std::vector<std::max_align_t>(size / sizeof(std::max_align_t) + 1));
    auto *const result = reinterpret_cast<LumoQueryResult *>(storage->data());
    result->count = static_cast<int32_t>(ids.size());
    LumoQueryEntry **entries = result->entries;
    for (Text const &id : ids) {
        *entries++ = keep(LumoQueryEntry{text(id), ""});
    }
    return result;
}

LumoQueryResult *LumoRecords::queryWithCount(int32_t count) {
    LumoQueryResult *const result = query({});
    result->count = count;
    return result;
}

LumoSpaceStats *LumoRecords::spaceStats(int64_t logical, int64_t committed, int64_t unshared, uint8_t valid) {
    return keep(LumoSpaceStats{0xDEADBEEF, logical, committed, unshared, valid});
}

LumoInfo *LumoRecords::info(Text const &storageProfile) {
    return keep(LumoInfo{0xDEADBEEF, 0xDEADBEEF, text(storageProfile)});
}

LumoMetadata *LumoRecords::metadata(std::vector<std::pair<Text, Text>> const &pairs) {
    LumoMetadataEntry *first = nullptr;
    for (auto pair = pairs.rbegin(); pair != pairs.rend(); ++pair) {
        first = keep(LumoMetadataEntry{text(pair->first), text(pair->second), first});
    }
    return keep(LumoMetadata{first});
}

} // namespace Doubles
