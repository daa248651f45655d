// SPDX-License-Identifier: Apache-2.0
#include "sqlite/Transaction.h"

#include <sqlite3.h>

#include "sqlite/Database.h"

namespace Sqlite {

Transaction::Transaction(Database &database, Kind kind)
    : database_(&database) {
    if (kind == Kind::Write) {
        Query(database, "BEGIN IMMEDIATE").run();
    } else {
        Query(database, "BEGIN").run();
    }
}

Transaction::~Transaction() {
    // SQLite rolls back by itself after some errors; there is nothing to do then.
    if (database_ == nullptr || sqlite3_get_autocommit(database_->handle_.get()) != 0) {
        return;
    }
    try {
        Query(*database_, "ROLLBACK").run();
    } catch (std::exception const &) {
        // Closing the connection, or the next opener, rolls back.
    }
}

void Transaction::commit() {
    Query(*database_, "COMMIT").run();
    database_ = nullptr;
}

} // namespace Sqlite
