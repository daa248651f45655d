// SPDX-License-Identifier: Apache-2.0
#include "orka/ArrayFile.h"

#include "ArraySchema.h"
#include "FileFailure.h"
#include "RandomUuid.h"
#include "VolumeRows.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"

namespace Orka {

namespace {

/// Volumes are looked up by ids, which lie anywhere in their index: where it does not fit, each look-up reads pages
/// anew. This much holds the index of a hundred thousand.
constexpr int cacheKib = 8 << 10;

std::unique_ptr<Sqlite::Database> open(std::string const &path, std::chrono::milliseconds busyTimeout) {
    Sqlite::Options options;
    options.busyTimeout = busyTimeout;
    options.cacheKib = cacheKib;
    return onFile([&] {
        return std::make_unique<Sqlite::Database>(path, arrayFileIdentity(), Sqlite::Mode::ReadWrite, options);
    });
}

Endpoint endpointOf(Sqlite::Query const &row) {
    Endpoint endpoint;
    endpoint.uid = optionalText(row, 2);
    endpoint.type = static_cast<int32_t>(row.integer(3));
    endpoint.text1 = optionalText(row, 4);
    endpoint.text2 = optionalText(row, 5);
    endpoint.isAccessible = row.integer(6) != 0;
    endpoint.isConfigured = row.integer(7) != 0;
    return endpoint;
}

void readEndpoints(Sqlite::Database &database, int64_t array, std::vector<Endpoint> &endpoints) {
    auto rows = database.query("SELECT seq, array, uid, type, text1, text2, accessible, configured FROM endpoint "
                               "WHERE array = ? ORDER BY seq");
    auto addresses = database.query("SELECT address FROM endpoint_address WHERE endpoint = ? ORDER BY position");
    rows.bind(1, array);
    while (rows.step()) {
        endpoints.push_back(endpointOf(rows));
        addresses.bind(1, rows.integer(0));
        while (addresses.step()) {
            endpoints.back().nfs4xAddresses.push_back(addresses.text(0));
        }
        addresses.reset();
    }
}

std::vector<StorageArray> readArrays(Sqlite::Database &database) {
    std::vector<StorageArray> arrays;
    auto rows = database.query("SELECT seq, id, name, vendor_id, model_id FROM storage_array ORDER BY seq");
    while (rows.step()) {
        StorageArray array;
        array.id = rows.text(1);
        array.name = rows.text(2);
        array.vendorId = rows.text(3);
        array.modelId = rows.text(4);
        readEndpoints(database, rows.integer(0), array.endpoints);
        arrays.push_back(std::move(array));
    }
    return arrays;
}

std::vector<StorageContainer> readContainers(Sqlite::Database &database) {
    std::vector<StorageContainer> containers;
    auto rows = database.query("SELECT seq, id, name, max_lumo_size_mb FROM container ORDER BY seq");
    // Walked once beside the containers, in the same order.
    auto holders = database.query("SELECT h.container, a.id FROM container_array h "
                                  "CROSS JOIN storage_array a ON a.seq = h.array ORDER BY h.container, h.position");
    bool more = holders.step();
    while (rows.step()) {
        StorageContainer container;
        container.id = rows.text(1);
        container.name = rows.text(2);
        container.maxLumoSizeMb = rows.integer(3);
        requireId(database, container.id, "a storage container");
        if (container.maxLumoSizeMb <= 0) {
            failDamaged(database, "the storage container " + container.id + " has no size");
        }
        for (auto const seq = rows.integer(0); more && holders.integer(0) == seq; more = holders.step()) {
            container.arrayIds.push_back(holders.text(1));
        }
        containers.push_back(std::move(container));
    }
    return containers;
}

} // namespace

ArrayFile::ArrayFile(std::string const &path, std::chrono::milliseconds busyTimeout,
                     std::function<std::string()> newUuid)
    : database_(open(path, busyTimeout))
    , newUuid_(newUuid ? std::move(newUuid) : randomUuid) {}

ArrayFile::~ArrayFile() = default;

std::string const &ArrayFile::path() const noexcept {
    return database_->path();
}

bool ArrayFile::hasMoved() const {
    return onFile([&] { return database_->hasMoved(); });
}

int64_t ArrayFile::dataVersion() {
    return onFile([&] { return database_->dataVersion(); });
}

void ArrayFile::checkIntegrity() {
    onFile([&] { database_->checkIntegrity(); });
}

ArrayFileCounts ArrayFile::counts() {
    return onFile([&] {
        auto row = database_->query("SELECT (SELECT count(*) FROM storage_array), (SELECT count(*) FROM endpoint), "
                                    "(SELECT count(*) FROM container), "
                                    "(SELECT count(*) FROM volume WHERE kind = 0), "
                                    "(SELECT count(*) FROM volume WHERE kind = 1), "
                                    "(SELECT count(*) FROM volume WHERE bound_to IS NOT NULL), "
                                    "(SELECT count(*) FROM metadata)");
        row.step();
        ArrayFileCounts counts;
        counts.arrays = row.integer(0);
        counts.endpoints = row.integer(1);
        counts.containers = row.integer(2);
        counts.configVolumes = row.integer(3);
        counts.dataVolumes = row.integer(4);
        counts.boundVolumes = row.integer(5);
        counts.metadataPairs = row.integer(6);
        return counts;
    });
}

Inventory ArrayFile::inventory() {
    return onFile([&] {
        Inventory inventory;
        // The version is read inside, so that it is the version of what is read.
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        inventory.dataVersion = database_->dataVersion();
        inventory.arrays = readArrays(*database_);
        inventory.containers = readContainers(*database_);
        return inventory;
    });
}

std::optional<std::string> ArrayFile::hostContext() {
    return onFile([&] {
        auto row = database_->query("SELECT context FROM host_context");
        if (!row.step()) {
            failDamaged(*database_, "it has no place for the host's context"); // an update would go nowhere
        }
        return optionalText(row, 0);
    });
}

} // namespace Orka
