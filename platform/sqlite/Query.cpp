// SPDX-License-Identifier: Apache-2.0
#include "sqlite/Query.h"

#include <string>

#include <SQLiteCpp/SQLiteCpp.h>

#include "sqlite/Database.h"

namespace Sqlite {

Query::Query(Database &database, std::string_view sql)
    : database_(&database)
    , statement_(database.take(sql)) {}

Query::~Query() {
    if (statement_) {
        database_->giveBack(std::move(statement_));
    }
}

Query::Query(Query &&other) noexcept = default;

Query &Query::bind(int parameter, int64_t value) {
    try {
        statement_->bind(parameter, value);
    } catch (SQLite::Exception const &cause) {
        database_->fail(cause);
    }
    return *this;
}

Query &Query::bind(int parameter, std::string_view value) {
    try {
        statement_->bind(parameter, std::string(value));
    } catch (SQLite::Exception const &cause) {
        database_->fail(cause);
    }
    return *this;
}

Query &Query::bindNull(int parameter) {
    try {
        statement_->bind(parameter);
    } catch (SQLite::Exception const &cause) {
        database_->fail(cause);
    }
    return *this;
}

bool Query::step() {
    try {
        return statement_->executeStep();
    } catch (SQLite::Exception const &cause) {
        database_->fail(cause);
    }
}

void Query::run() {
    while (step()) {
    }
    reset();
}

void Query::reset() {
    statement_->tryReset();
}

template <typename Read>
auto Query::column(int index, Read const &read) const {
    try {
        return read(statement_->getColumn(index));
    } catch (SQLite::Exception const &cause) {
        database_->fail(cause);
    }
}

int64_t Query::integer(int column) const {
    return this->column(column, [](SQLite::Column const &value) { return value.getInt64(); });
}

std::string Query::text(int column) const {
    return std::string(textView(column));
}

std::string_view Query::textView(int column) const {
    return this->column(column, [](SQLite::Column const &value) {
        char const *const text = value.getText();
        return std::string_view(text, static_cast<std::size_t>(value.getBytes()));
    });
}

bool Query::isNull(int column) const {
    return this->column(column, [](SQLite::Column const &value) { return value.isNull(); });
}

} // namespace Sqlite
