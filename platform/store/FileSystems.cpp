// SPDX-License-Identifier: Apache-2.0
#include "Translate.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"
#include "store/HostStore.h"

namespace Store {
namespace {

std::optional<FileSystem> find(Sqlite::Database *database, char const *sql, std::string_view key) {
    if (database == nullptr) {
        return std::nullopt;
    }
    Sqlite::Query row(*database, sql);
    row.bind(1, key);
    std::optional<FileSystem> found;
    while (row.step()) {
        if (!found) {
            found = FileSystem{row.text(0), row.text(1), {}};
        }
        if (!row.isNull(2)) {
            found->arrayIds.push_back(row.text(2));
        }
    }
    return found;
}

[[noreturn]] void refuseTaken(FileSystem const &wanted, std::string const &name, std::string const &containerId) {
    throw Wire::Failure(Wire::ErrorCode::AlreadyExists,
                        wanted.containerId == containerId
                            ? "the storage container " + containerId + " is mounted already, as '" + name + '\''
                            : "the name '" + name + "' is taken: the storage container " + containerId +
                                  " is mounted under it");
}

[[noreturn]] void refuseInUse(std::string const &name, int64_t count, std::string const &first) {
    throw Wire::Failure(Wire::ErrorCode::InUse,
                        count == 1 ? "the storage container '" + name + "' is in use: the config volume '" + first +
                                         "' is mounted in it"
                                   : "the storage container '" + name + "' is in use: " + std::to_string(count) +
                                         " config volumes are mounted in it, the first is '" + first + '\'');
}

void refuseMounts(Sqlite::Database &database, std::string_view containerId) {
    Sqlite::Query used(database, "SELECT f.name, v.directory_name, count(*) OVER () FROM file_system f "
                                 "JOIN volume v ON v.file_system = f.id AND v.state IN (0, 2) "
                                 "WHERE f.container_id = ?1 ORDER BY v.id LIMIT 1");
    if (used.bind(1, containerId).step()) {
        refuseInUse(used.text(0), used.integer(2), used.text(1));
    }
}

} // namespace

std::vector<FileSystem> HostStore::fileSystems() {
    return translated([this] {
        std::vector<FileSystem> fileSystems;
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return fileSystems;
        }
        Sqlite::Query row(*database, "SELECT f.id, f.name, f.container_id, a.array_id "
                                     "FROM file_system f LEFT JOIN file_system_array a ON a.file_system = f.id "
                                     "ORDER BY f.id, a.position");
        int64_t last = 0;
        while (row.step()) {
            if (fileSystems.empty() || row.integer(0) != last) {
                last = row.integer(0);
                fileSystems.push_back({row.text(1), row.text(2), {}});
            }
            if (!row.isNull(3)) {
                fileSystems.back().arrayIds.push_back(row.text(3));
            }
        }
        return fileSystems;
    });
}

void HostStore::visitFileSystems(std::function<void(std::string_view, std::string_view)> const &visit) {
    translated([&] {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return;
        }
        Sqlite::Query row(*database, "SELECT name, container_id FROM file_system ORDER BY id");
        while (row.step()) {
            visit(row.textView(0), row.textView(1));
        }
    });
}

std::optional<FileSystem> HostStore::fileSystem(std::string_view containerId) {
    return translated([&] {
        return find(
            reader(),
            "SELECT f.name, f.container_id, a.array_id FROM file_system f "
            "LEFT JOIN file_system_array a ON a.file_system = f.id WHERE f.container_id = ?1 ORDER BY a.position",
            containerId);
    });
}

std::optional<FileSystem> HostStore::fileSystemNamed(std::string_view name) {
    return translated([&] {
        return find(reader(),
                    "SELECT f.name, f.container_id, a.array_id FROM file_system f "
                    "LEFT JOIN file_system_array a ON a.file_system = f.id WHERE f.name = ?1 ORDER BY a.position",
                    name);
    });
}

void HostStore::addFileSystem(FileSystem const &fileSystem) {
    translated([&] {
        Sqlite::Database &database = writer();
        Sqlite::Transaction transaction(database);
        Sqlite::Query taken(database, "SELECT name, container_id FROM file_system WHERE container_id = ?1 "
                                      "UNION ALL SELECT name, container_id FROM file_system WHERE name = ?2");
        if (taken.bind(1, fileSystem.containerId).bind(2, fileSystem.name).step()) {
            refuseTaken(fileSystem, taken.text(0), taken.text(1));
        }
        taken.reset();
        Sqlite::Query(database, "INSERT INTO file_system (name, container_id) VALUES (?1, ?2)")
            .bind(1, fileSystem.name)
            .bind(2, fileSystem.containerId)
            .run();
        int64_t const id = database.lastInsertId();
        Sqlite::Query array(database,
                            "INSERT INTO file_system_array (file_system, position, array_id) VALUES (?1, ?2, ?3)");
        int64_t position = 0;
        for (std::string const &arrayId : fileSystem.arrayIds) {
            array.bind(1, id).bind(2, position++).bind(3, arrayId).run();
        }
        transaction.commit();
    });
}

void HostStore::requireNoMounts(std::string_view containerId) {
    translated([&] {
        if (Sqlite::Database *const database = reader(); database != nullptr) {
            refuseMounts(*database, containerId);
        }
    });
}

bool HostStore::removeFileSystem(std::string_view containerId) {
    return translated([&] {
        if (reader() == nullptr) {
            return false;
        }
        Sqlite::Database &database = writer();
        Sqlite::Transaction transaction(database);
        refuseMounts(database, containerId);
        Sqlite::Query(database, "DELETE FROM file_system WHERE container_id = ?1").bind(1, containerId).run();
        bool const removed = database.changes() != 0;
        if (removed) {
            transaction.commit();
        }
        return removed;
    });
}

} // namespace Store
