// SPDX-License-Identifier: Apache-2.0
#include "Translate.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"
#include "store/HostStore.h"

namespace Store {
namespace {

constexpr char const *arraysOfOne =
    "SELECT array_id, is_active, priority FROM provider_array WHERE provider = ?1 ORDER BY position";

ProviderArray readArray(Sqlite::Query const &row, int firstColumn) {
    return {row.text(firstColumn), row.integer(firstColumn + 1) != 0,
            static_cast<int32_t>(row.integer(firstColumn + 2))};
}

std::optional<Provider> find(Sqlite::Database &database, std::string_view name) {
    Sqlite::Query row(database, "SELECT id, name, url, aux_text FROM provider WHERE name = ?1");
    if (!row.bind(1, name).step()) {
        return std::nullopt;
    }
    Provider provider{row.text(1), row.text(2), row.text(3), {}};
    Sqlite::Query arrays(database, arraysOfOne);
    arrays.bind(1, row.integer(0));
    while (arrays.step()) {
        provider.arrays.push_back(readArray(arrays, 0));
    }
    return provider;
}

void put(Sqlite::Database &database, Provider const &provider) {
    Sqlite::Query record(database, "INSERT INTO provider (name, url, aux_text) VALUES (?1, ?2, ?3) "
                                   "ON CONFLICT (name) DO UPDATE SET url = excluded.url, aux_text = excluded.aux_text "
                                   "RETURNING id");
    record.bind(1, provider.name).bind(2, provider.url).bind(3, provider.auxText).step();
    int64_t const id = record.integer(0);
    record.reset();

    Sqlite::Query(database, "DELETE FROM provider_array WHERE provider = ?1").bind(1, id).run();
    Sqlite::Query array(database, "INSERT INTO provider_array (provider, position, array_id, is_active, priority) "
                                  "VALUES (?1, ?2, ?3, ?4, ?5)");
    int64_t position = 0;
    for (ProviderArray const &entry : provider.arrays) {
        array.bind(1, id).bind(2, position++).bind(3, entry.arrayId);
        array.bind(4, int64_t{entry.isActive}).bind(5, int64_t{entry.priority}).run();
    }
}

} // namespace

std::vector<Provider> HostStore::providers() {
    return translated([this] {
        std::vector<Provider> providers;
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return providers;
        }
        Sqlite::Query row(*database, "SELECT p.id, p.name, p.url, p.aux_text, a.array_id, a.is_active, a.priority "
                                     "FROM provider p LEFT JOIN provider_array a ON a.provider = p.id "
                                     "ORDER BY p.id, a.position");
        int64_t last = 0;
        while (row.step()) {
            if (providers.empty() || row.integer(0) != last) {
                last = row.integer(0);
                providers.push_back({row.text(1), row.text(2), row.text(3), {}});
            }
            if (!row.isNull(4)) {
                providers.back().arrays.push_back(readArray(row, 4));
            }
        }
        return providers;
    });
}

std::optional<Provider> HostStore::provider(std::string_view name) {
    return translated([&]() -> std::optional<Provider> {
        Sqlite::Database *const database = reader();
        if (database == nullptr) {
            return std::nullopt;
        }
        Sqlite::Transaction const oneState(*database, Sqlite::Transaction::Kind::Read);
        return find(*database, name);
    });
}

bool HostStore::hasProvider(std::string_view name) {
    return translated([&] {
        Sqlite::Database *const database = reader();
        return database != nullptr &&
               Sqlite::Query(*database, "SELECT 1 FROM provider WHERE name = ?1").bind(1, name).step();
    });
}

void HostStore::putProviders(std::vector<Provider> const &providers) {
    if (providers.empty()) {
        return;
    }
    translated([&] {
        Sqlite::Database &database = writer();
        Sqlite::Transaction transaction(database);
        bool changed = false;
        for (Provider const &provider : providers) {
            // A record written back as it was read costs no sync.
            if (find(database, provider.name) != provider) {
                put(database, provider);
                changed = true;
            }
        }
        if (changed) {
            transaction.commit();
        }
    });
}

bool HostStore::removeProvider(std::string_view name) {
    return translated([&] {
        if (reader() == nullptr) {
            return false;
        }
        Sqlite::Database &database = writer();
        Sqlite::Transaction transaction(database);
        Sqlite::Query(database, "DELETE FROM provider WHERE name = ?1").bind(1, name).run();
        bool const removed = database.changes() != 0;
        if (removed) {
            transaction.commit();
        }
        return removed;
    });
}

} // namespace Store
