// SPDX-License-Identifier: Apache-2.0
#include "Translate.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"
#include "store/HostStore.h"

namespace Store {
namespace {

constexpr char const *orkaContextName = "orka_context";

/// Runs one statement durably; one that changes nothing costs no sync.
void change(Sqlite::Database &database, char const *sql, std::string_view key) {
    Sqlite::Transaction transaction(database);
    Sqlite::Query(database, sql).bind(1, key).run();
    if (database.changes() != 0) {
        transaction.commit();
    }
}

} // namespace

std::vector<std::string> HostStore::endpointOutages() {
    return translated([this] {
        std::vector<std::string> uids;
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return uids;
        }
        Sqlite::Query row(*database, "SELECT uid FROM endpoint_outage ORDER BY uid");
        while (row.step()) {
            uids.push_back(row.text(0));
        }
        return uids;
    });
}

void HostStore::setEndpointOutage(std::string_view uid, bool outage) {
    translated([&] {
        if (outage) {
            change(writer(), "INSERT INTO endpoint_outage (uid) VALUES (?1) ON CONFLICT (uid) DO NOTHING", uid);
        } else if (reader() != nullptr) {
            change(writer(), "DELETE FROM endpoint_outage WHERE uid = ?1", uid);
        }
    });
}

std::optional<std::string> HostStore::orkaContext() {
    return translated([this]() -> std::optional<std::string> {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::nullopt;
        }
        Sqlite::Query row(*database, "SELECT value FROM setting WHERE name = ?1");
        return row.bind(1, std::string_view(orkaContextName)).step() ? std::optional<std::string>(row.text(0))
                                                                     : std::nullopt;
    });
}

void HostStore::setOrkaContext(std::string_view uuid) {
    translated([&] {
        Sqlite::Database &database = writer();
        Sqlite::Transaction transaction(database);
        Sqlite::Query(database, "INSERT INTO setting (name, value) VALUES (?1, ?2) "
                                "ON CONFLICT (name) DO UPDATE SET value = excluded.value")
            .bind(1, std::string_view(orkaContextName))
            .bind(2, uuid)
            .run();
        transaction.commit();
    });
}

void HostStore::clearOrkaContext() {
    translated([this] {
        if (reader() != nullptr) {
            change(writer(), "DELETE FROM setting WHERE name = ?1", orkaContextName);
        }
    });
}

} // namespace Store
