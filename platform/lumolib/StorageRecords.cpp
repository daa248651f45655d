// SPDX-License-Identifier: Apache-2.0
#include "StorageRecords.h"

#include <cstring>

namespace LumoClient {

void StorageRecords::take(Compact::Reply::Reader reply) {
    switch (reply.which()) {
    case Compact::Reply::STORAGE_ARRAYS:
        return takeArrays(reply.getStorageArrays());
    case Compact::Reply::STORAGE_CONTAINERS:
        return takeContainers(reply.getStorageContainers());
    case Compact::Reply::DONE:
        return;
    default:
        throw connection_.unexpected("it answered something else than storage containers");
    }
}

void StorageRecords::finish(StorageContainerResult &result) {
    std::size_t count = 0;
    for (Chunk const &chunk : chunks_) {
        count += chunk.count;
    }
    result.containers = arena_.unsetRecords<StorageContainerInfo *>(count);
    StorageContainerInfo **next = result.containers;
    for (Chunk const &chunk : chunks_) {
        for (std::size_t place = 0; place < chunk.count; ++place) {
            *next++ = chunk.first + place;
        }
    }
    result.containerCount = static_cast<std::uint32_t>(count);
    arena_.trim();
}

void StorageRecords::takeArrays(Compact::List<Compact::StorageArray>::Reader arrays) {
    connection_.requireChunk(arrays.size());
    auto *record = arena_.records<StorageArrayInfo>(arrays.size());
    table_.reserve(table_.size() + arrays.size());
    for (Compact::StorageArray::Reader const array : arrays) {
        fillArray(*record, array);
        table_.push_back(record++);
    }
}

void StorageRecords::takeContainers(Compact::List<Compact::StorageContainer>::Reader containers) {
    connection_.requireChunk(containers.size());
    Chunk const chunk{arena_.unsetRecords<StorageContainerInfo>(containers.size()), containers.size()};
    StorageContainerInfo *record = chunk.first;
    for (Compact::StorageContainer::Reader const container : containers) {
        fillContainer(*record++, container);
    }
    chunks_.push_back(chunk);
}

void StorageRecords::fillArray(StorageArrayInfo &record, Compact::StorageArray::Reader array) {
    Compact::List<Compact::Endpoint>::Reader const endpoints = array.getEndpoints();
    record.arrayId = arena_.copy(array.getId());
    record.name = arena_.copy(array.getName());
    record.vendorId = arena_.copy(array.getVendorId());
    record.modelId = arena_.copy(array.getModelId());
    record.endpointCount = static_cast<std::int32_t>(endpoints.size());
    record.endpoints = arena_.records<ProtocolEndpointInfo *>(endpoints.size());
    auto *endpointRecord = arena_.records<ProtocolEndpointInfo>(endpoints.size());
    for (unsigned place = 0; place < endpoints.size(); ++place) {
        fillEndpoint(endpointRecord[place], endpoints[place]);
        record.endpoints[place] = &endpointRecord[place];
    }
}

void StorageRecords::fillEndpoint(ProtocolEndpointInfo &record, Compact::Endpoint::Reader endpoint) {
    Compact::List<Compact::Text>::Reader const addresses = endpoint.getAddresses();
    record.localUID = endpoint.hasUid() ? arena_.copy(endpoint.getUid()) : nullptr;
    record.nfs4xAddressCount = static_cast<std::int32_t>(addresses.size());
    record.nfs4xAddresses = arena_.records<char const *>(addresses.size());
    for (unsigned place = 0; place < addresses.size(); ++place) {
        record.nfs4xAddresses[place] = arena_.copy(addresses[place]);
    }
    record.transport = arena_.records<EndpointTransportInfo>(1);
    record.transport->type = endpoint.getType();
    record.transport->text1 = endpoint.hasText1() ? arena_.copy(endpoint.getText1()) : nullptr;
    record.transport->text2 = endpoint.hasText2() ? arena_.copy(endpoint.getText2()) : nullptr;
    record.isAccessible = endpoint.getIsAccessible() ? 1 : 0;
    record.isConfigured = endpoint.getIsConfigured() ? 1 : 0;
}

void StorageRecords::fillContainer(StorageContainerInfo &record, Compact::StorageContainer::Reader container) {
    Compact::List<std::uint32_t>::Reader const places = container.getArrays();
    record = StorageContainerInfo{};
    record.id = arena_.copy(container.getId());
    record.name = arena_.copy(container.getName());
    record.providerUrl = providerUrl(container.getProviderUrl());
    record.maxLumoSizeMb = container.getMaxLumoSizeMb();
    record.arrayCount = static_cast<std::int32_t>(places.size());
    record.arrays = arraysOf(places);
    if (record.maxLumoSizeMb < 0) {
        throw connection_.unexpected("a container has a negative size");
    }
}

StorageArrayInfo **StorageRecords::arraysOf(Compact::List<std::uint32_t>::Reader places) {
    bool repeated = places.size() == lastArrayCount_;
    for (unsigned place = 0; place < places.size(); ++place) {
        if (places[place] >= table_.size()) {
            throw connection_.unexpected("a container names array " + std::to_string(places[place]) + " of " +
                                         std::to_string(table_.size()));
        }
        repeated = repeated && lastArrays_[place] == table_[places[place]];
    }
    if (!repeated) {
        auto **arrays = arena_.records<StorageArrayInfo *>(places.size());
        for (unsigned place = 0; place < places.size(); ++place) {
            arrays[place] = table_[places[place]];
        }
        lastArrays_ = arrays;
        lastArrayCount_ = places.size();
    }
    return lastArrays_;
}

char const *StorageRecords::providerUrl(std::string_view url) {
    if (url.size() != lastUrlLength_ || std::memcmp(url.begin(), lastUrl_, lastUrlLength_) != 0) {
        lastUrl_ = arena_.copy(url);
        lastUrlLength_ = url.size();
    }
    return lastUrl_;
}

} // namespace LumoClient
