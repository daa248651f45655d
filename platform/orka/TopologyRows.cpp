// SPDX-License-Identifier: Apache-2.0
#include "TopologyRows.h"

#include <unordered_map>

#include "sqlite/Transaction.h"

namespace Orka {

namespace {

/// Row numbers by what others refer to things by.
using Rows = std::unordered_map<std::string, int64_t>;

void bindOptional(Sqlite::Query &query, int parameter, std::optional<std::string> const &text) {
    if (text) {
        query.bind(parameter, *text);
    } else {
        query.bindNull(parameter);
    }
}

struct Numbers {
    Rows arrays;
    Rows endpoints;
    Rows containers;
};

void insertEndpoints(Sqlite::Database &database, StorageArray const &array, Numbers &numbers) {
    auto insert = database.query("INSERT INTO endpoint (array, uid, type, text1, text2, accessible, configured) "
                                 "VALUES (?, ?, ?, ?, ?, ?, ?)");
    auto address = database.query("INSERT INTO endpoint_address (endpoint, position, address) VALUES (?, ?, ?)");
    for (auto const &endpoint : array.endpoints) {
        insert.bind(1, numbers.arrays.at(array.id))
            .bind(3, int64_t{endpoint.type})
            .bind(6, int64_t{endpoint.isAccessible})
            .bind(7, int64_t{endpoint.isConfigured});
        bindOptional(insert, 2, endpoint.uid);
        bindOptional(insert, 4, endpoint.text1);
        bindOptional(insert, 5, endpoint.text2);
        insert.run();
        auto const row = database.lastInsertId();
        if (endpoint.uid) {
            numbers.endpoints.emplace(*endpoint.uid, row);
        }
        int64_t position = 0;
        for (auto const &text : endpoint.nfs4xAddresses) {
            address.bind(1, row).bind(2, position++).bind(3, text).run();
        }
    }
}

void insertArrays(Sqlite::Database &database, Topology const &topology, Numbers &numbers) {
    auto insert = database.query("INSERT INTO storage_array (id, name, vendor_id, model_id) VALUES (?, ?, ?, ?)");
    for (auto const &array : topology.arrays) {
        insert.bind(1, array.id).bind(2, array.name).bind(3, array.vendorId).bind(4, array.modelId).run();
        numbers.arrays.emplace(array.id, database.lastInsertId());
        insertEndpoints(database, array, numbers);
    }
}

void insertContainers(Sqlite::Database &database, Topology const &topology, Numbers &numbers) {
    auto insert = database.query("INSERT INTO container (id, name, max_lumo_size_mb) VALUES (?, ?, ?)");
    auto holder = database.query("INSERT INTO container_array (container, position, array) VALUES (?, ?, ?)");
    for (auto const &container : topology.containers) {
        insert.bind(1, container.id).bind(2, container.name).bind(3, container.maxLumoSizeMb).run();
        auto const row = database.lastInsertId();
        numbers.containers.emplace(container.id, row);
        int64_t position = 0;
        for (auto const &array : container.arrayIds) {
            holder.bind(1, row).bind(2, position++).bind(3, numbers.arrays.at(array)).run();
        }
    }
}

void bindVolume(Sqlite::Query &insert, VirtualVolume const &volume, Numbers const &numbers) {
    insert.bind(1, volume.uuid)
        .bind(2, numbers.containers.at(volume.containerId))
        .bind(3, int64_t{static_cast<int32_t>(volume.kind)})
        .bind(5, volume.sizeMb)
        .bind(6, volume.committedMb)
        .bind(9, volume.blockSize)
        .bind(10, volume.vmUuid);
    bindOptional(insert, 4,
                 volume.directoryName.empty() ? std::nullopt : std::optional<std::string>(volume.directoryName));
    bindOptional(insert, 8, volume.profile);
    if (volume.unsharedMb) {
        insert.bind(7, *volume.unsharedMb);
    } else {
        insert.bindNull(7);
    }
    if (volume.boundTo) {
        insert.bind(11, numbers.endpoints.at(*volume.boundTo));
    } else {
        insert.bindNull(11);
    }
}

void insertVolumes(Sqlite::Database &database, Topology const &topology, Numbers const &numbers) {
    auto insert = database.query(
        "INSERT INTO volume (uuid, container, kind, directory_name, size_mb, committed_mb, unshared_mb, profile, "
        "block_size, vm_uuid, bound_to) VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)");
    auto pair = database.query("INSERT INTO metadata (volume, position, key, value) VALUES (?, ?, ?, ?)");
    for (auto const &[volume, metadata] : topology.volumes) {
        bindVolume(insert, volume, numbers);
        insert.run();
        auto const row = database.lastInsertId();
        int64_t position = 0;
        for (auto const &[key, value] : metadata) {
            pair.bind(1, row).bind(2, position++).bind(3, key).bind(4, value).run();
        }
    }
}

} // namespace

void insertTopology(Sqlite::Database &database, Topology const &topology) {
    Numbers numbers;
    Sqlite::Transaction transaction(database);
    insertArrays(database, topology, numbers);
    insertContainers(database, topology, numbers);
    insertVolumes(database, topology, numbers);
    transaction.commit();
}

} // namespace Orka
