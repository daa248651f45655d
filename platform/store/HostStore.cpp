// SPDX-License-Identifier: Apache-2.0
#include "store/HostStore.h"

#include "Schema.h"
#include "Translate.h"
#include "sqlite/Database.h"
#include "sqlite/Transaction.h"
#include "store/Directory.h"
#include "wire/Paths.h"

namespace Store {

namespace {

/// A link could have whoever works in a root of somebody else's change a file outside of it.
Sqlite::Options optionsOf(std::chrono::milliseconds busyTimeout) {
    Sqlite::Options options;
    options.busyTimeout = busyTimeout;
    options.refusesLink = true;
    return options;
}

} // namespace

HostStore::HostStore(std::string const &root, Mode mode, std::chrono::milliseconds busyTimeout)
    : root_(root)
    , path_(Wire::Paths(root).hostStore())
    , mode_(mode)
    , busyTimeout_(busyTimeout) {}

HostStore::~HostStore() = default;

Sqlite::Database *HostStore::reader() {
    if (database_ && !changing_ && database_->hasMoved()) {
        database_.reset();
        ++generation_;
    }
    if (!database_) {
        auto const how = mode_ == Mode::ReadWrite ? Sqlite::Mode::ReadWrite : Sqlite::Mode::QueryOnly;
        try {
            database_ = std::make_unique<Sqlite::Database>(path_, identity(), how, optionsOf(busyTimeout_));
        } catch (Sqlite::Error const &error) {
            if (error.kind() != Sqlite::ErrorKind::Missing) {
                throw;
            }
            return nullptr;
        }
        ++generation_;
    }
    return database_.get();
}

Sqlite::Database &HostStore::writer() {
    if (mode_ == Mode::QueryOnly) {
        throw Wire::Failure(Wire::ErrorCode::FileReadOnly,
                            "the host store '" + path_ + "' was opened for reading only");
    }
    if (reader() == nullptr) {
        makeDirectoryDurably(root_);
        database_ =
            std::make_unique<Sqlite::Database>(path_, identity(), Sqlite::Mode::Create, optionsOf(busyTimeout_));
        ++generation_;
    }
    return *database_;
}

HostStore::Change::Change(HostStore &store)
    : store_(store) {
    translated([this] { transaction_ = std::make_unique<Sqlite::Transaction>(store_.writer()); });
    store_.changing_ = true;
}

HostStore::Change::~Change() {
    store_.changing_ = false;
}

void HostStore::Change::commit() {
    store_.changing_ = false;
    translated([this] { transaction_->commit(); });
}

void HostStore::checkIntegrity() {
    translated([this] {
        if (Sqlite::Database *const database = reader()) {
            database->checkIntegrity();
        }
    });
}

int64_t HostStore::dataVersion() {
    return translated([this] {
        Sqlite::Database *const database = reader();
        // SQLite's own number begins anew with each connection, and is 32 bits wide.
        return generation_ * (int64_t{1} << 32) + (database == nullptr ? 0 : database->dataVersion());
    });
}

} // namespace Store
