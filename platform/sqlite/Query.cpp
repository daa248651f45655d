// SPDX-License-Identifier: Apache-2.0
#include "sqlite/Query.h"

#include <string>

#include <sqlite3.h>

#include "Explain.h"
#include "sqlite/Database.h"

namespace Sqlite {

void Finalize::operator()(sqlite3_stmt *statement) const noexcept {
    sqlite3_finalize(statement);
}

Query::Query(Database &database, std::string_view sql)
    : database_(&database)
    , statement_(database.take(sql)) {}

Query::~Query() {
    database_->giveBack(std::move(statement_));
}

Query &Query::bind(int parameter, int64_t value) {
    database_->check(sqlite3_bind_int64(statement_.get(), parameter, value));
    return *this;
}

Query &Query::bind(int parameter, std::string_view value) {
    // A null pointer would bind NULL.
    char const *const text = value.empty() ? "" : value.data();
    database_->check(
        sqlite3_bind_text64(statement_.get(), parameter, text, value.size(), SQLITE_TRANSIENT, SQLITE_UTF8));
    return *this;
}

Query &Query::bindNull(int parameter) {
    database_->check(sqlite3_bind_null(statement_.get(), parameter));
    return *this;
}

bool Query::step() {
    int const code = sqlite3_step(statement_.get());
    if (code != SQLITE_ROW && code != SQLITE_DONE) {
        database_->fail();
    }
    return code == SQLITE_ROW;
}

void Query::run() {
    while (step()) {
    }
    reset();
}

void Query::reset() {
    sqlite3_reset(statement_.get()); // tells again what step() has told
}

int Query::inRow(int column) const {
    if (column < 0 || column >= sqlite3_data_count(statement_.get())) {
        throw Error(ErrorKind::Other, named(database_->identity_.kindName, database_->path_) +
                                          " cannot be used: a query has no row with a column " +
                                          std::to_string(column));
    }
    return column;
}

int64_t Query::integer(int column) const {
    return sqlite3_column_int64(statement_.get(), inRow(column));
}

std::string Query::text(int column) const {
    return std::string(textView(column));
}

std::string_view Query::textView(int column) const {
    auto const *const text = reinterpret_cast<char const *>(sqlite3_column_text(statement_.get(), inRow(column)));
    return text == nullptr
               ? std::string_view()
               : std::string_view(text, static_cast<std::size_t>(sqlite3_column_bytes(statement_.get(), column)));
}

bool Query::isNull(int column) const {
    return sqlite3_column_type(statement_.get(), inRow(column)) == SQLITE_NULL;
}

} // namespace Sqlite
