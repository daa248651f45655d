// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <string>

#include "Translate.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"
#include "store/HostStore.h"

namespace Store {
namespace {

Volume readVolume(Sqlite::Database const &database, Sqlite::Query const &row) {
    Volume volume{row.text(0), row.text(1), row.text(2), static_cast<VolumeState>(row.integer(3))};
    if (volume.state < VolumeState::Mounted || volume.state > VolumeState::Removing) {
        throw Sqlite::Error(Sqlite::ErrorKind::Malformed, "the host store '" + database.path() +
                                                              "' is damaged: it knows no state " +
                                                              std::to_string(row.integer(3)) + " of config volumes");
    }
    return volume;
}

/// Every row of a query whose columns are uuid, container id, directory name and state.
std::vector<Volume> readAll(Sqlite::Database const &database, Sqlite::Query &query) {
    std::vector<Volume> volumes;
    while (query.step()) {
        volumes.push_back(readVolume(database, query));
    }
    return volumes;
}

std::optional<Volume> readOne(Sqlite::Database const &database, Sqlite::Query &query) {
    return query.step() ? std::optional<Volume>(readVolume(database, query)) : std::nullopt;
}

/// Only a record that is still in the state that was seen: another process may have gone on meanwhile.
void settle(Sqlite::Database &database, Volume const &volume) {
    switch (volume.state) {
    case VolumeState::Mounting:
        Sqlite::Query(database, "UPDATE volume SET state = 0 WHERE uuid = ?1 AND state = 2").bind(1, volume.uuid).run();
        break;
    case VolumeState::Unmounting:
        Sqlite::Query(database, "UPDATE volume SET state = 1 WHERE uuid = ?1 AND state = 3").bind(1, volume.uuid).run();
        break;
    case VolumeState::Removing:
        Sqlite::Query(database, "DELETE FROM volume WHERE uuid = ?1 AND state = 4").bind(1, volume.uuid).run();
        break;
    case VolumeState::Mounted:
    case VolumeState::Unmounted:
        break;
    }
}

bool isMounted(VolumeState state) {
    return state == VolumeState::Mounted || state == VolumeState::Mounting;
}

void put(Sqlite::Database &database, Volume const &volume) {
    if (isMounted(volume.state)) {
        Sqlite::Query taken(
            database, "SELECT v.uuid FROM volume v JOIN file_system f ON f.id = v.file_system "
                      "WHERE f.container_id = ?1 AND v.directory_name = ?2 AND v.state IN (0, 2) AND v.uuid <> ?3");
        if (taken.bind(1, volume.containerId).bind(2, volume.directoryName).bind(3, volume.uuid).step()) {
            throw Wire::Failure(Wire::ErrorCode::AlreadyExists, "the directory name '" + volume.directoryName +
                                                                    "' is taken: the config volume " + taken.text(0) +
                                                                    " is mounted under it");
        }
    }
    Sqlite::Query(database, "INSERT INTO volume (uuid, file_system, directory_name, state) "
                            "SELECT ?1, id, ?3, ?4 FROM file_system WHERE container_id = ?2 "
                            "ON CONFLICT (uuid) DO UPDATE SET file_system = excluded.file_system, "
                            "directory_name = excluded.directory_name, state = excluded.state")
        .bind(1, volume.uuid)
        .bind(2, volume.containerId)
        .bind(3, volume.directoryName)
        .bind(4, static_cast<int64_t>(volume.state))
        .run();
    if (database.changes() == 0) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchContainer,
                            "the storage container " + volume.containerId + " is not mounted on this host");
    }
}

} // namespace

std::vector<Mount> HostStore::mounts() {
    return translated([this] {
        std::vector<Mount> mounts;
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return mounts;
        }
        Sqlite::Query row(*database,
                          "SELECT v.uuid, f.container_id, v.directory_name FROM volume v "
                          "JOIN file_system f ON f.id = v.file_system WHERE v.state IN (0, 2) ORDER BY v.id");
        while (row.step()) {
            mounts.push_back({row.text(0), row.text(1), row.text(2)});
        }
        return mounts;
    });
}

std::vector<Volume> HostStore::volumes() {
    return translated([this] {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::vector<Volume>();
        }
        Sqlite::Query query(*database, "SELECT v.uuid, f.container_id, v.directory_name, v.state FROM volume v "
                                       "JOIN file_system f ON f.id = v.file_system ORDER BY v.id");
        return readAll(*database, query);
    });
}

std::optional<Volume> HostStore::volume(std::string_view uuid) {
    return translated([&]() -> std::optional<Volume> {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::nullopt;
        }
        Sqlite::Query query(*database, "SELECT v.uuid, f.container_id, v.directory_name, v.state FROM volume v "
                                       "JOIN file_system f ON f.id = v.file_system WHERE v.uuid = ?1");
        return readOne(*database, query.bind(1, uuid));
    });
}

std::optional<Volume> HostStore::mountedVolume(std::string_view containerId, std::string_view directoryName) {
    return translated([&]() -> std::optional<Volume> {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::nullopt;
        }
        Sqlite::Query query(*database, "SELECT v.uuid, f.container_id, v.directory_name, v.state FROM file_system f "
                                       "JOIN volume v ON v.file_system = f.id AND v.state IN (0, 2) "
                                       "WHERE f.container_id = ?1 AND v.directory_name = ?2");
        return readOne(*database, query.bind(1, containerId).bind(2, directoryName));
    });
}

std::vector<Volume> HostStore::unmountedVolumes(std::string_view containerId, std::string_view directoryName) {
    return translated([&] {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::vector<Volume>();
        }
        Sqlite::Query query(*database, "SELECT v.uuid, f.container_id, v.directory_name, v.state FROM file_system f "
                                       "JOIN volume v ON v.file_system = f.id AND v.state IN (1, 3, 4) "
                                       "WHERE f.container_id = ?1 AND v.directory_name = ?2 ORDER BY v.id");
        return readAll(*database, query.bind(1, containerId).bind(2, directoryName));
    });
}

std::vector<UnsettledVolume> HostStore::unsettledVolumes() {
    return translated([this] {
        std::vector<UnsettledVolume> volumes;
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return volumes;
        }
        Sqlite::Query query(*database,
                            "SELECT v.uuid, f.container_id, v.directory_name, v.state, f.name "
                            "FROM volume v INDEXED BY volume_unsettled JOIN file_system f ON f.id = v.file_system "
                            "WHERE v.state IN (2, 3, 4) ORDER BY v.id");
        while (query.step()) {
            volumes.push_back({readVolume(*database, query), query.text(4)});
        }
        return volumes;
    });
}

void HostStore::putVolumes(std::vector<Volume> const &volumes, std::vector<Volume> const &settled) {
    if (volumes.empty() && settled.empty()) {
        return;
    }
    translated([&] {
        Sqlite::Database &database = writer();
        std::optional<Sqlite::Transaction> own;
        if (!changing_) {
            own.emplace(database);
        }
        for (Volume const &volume : settled) {
            // What is written anew below needs no settling first.
            if (std::none_of(volumes.begin(), volumes.end(),
                             [&](Volume const &other) { return other.uuid == volume.uuid; })) {
                settle(database, volume);
            }
        }
        for (Volume const &volume : volumes) {
            put(database, volume);
        }
        if (own) {
            own->commit();
        }
    });
}

} // namespace Store
