// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

struct sqlite3_stmt;

namespace Sqlite {

class Database;

struct Finalize {
    void operator()(sqlite3_stmt *statement) const noexcept;
};
using Statement = std::unique_ptr<sqlite3_stmt, Finalize>;

/// One use of a prepared statement. Parameters count from 1, columns from 0. Everything throws Sqlite::Error.
class Query {
public:
    Query(Database &database, std::string_view sql);
    ~Query();
    Query(Query const &) = delete;
    Query &operator=(Query const &) = delete;

    Query &bind(int parameter, int64_t value);
    /// Copies the text.
    Query &bind(int parameter, std::string_view value);
    Query &bindNull(int parameter);

    /// @return true when there is a row to read, false at the end.
    bool step();
    /// Runs to the end and makes the query ready to run again with other parameters.
    void run();
    /// Ready to run again; parameters keep their values until they are bound anew.
    void reset();

    int64_t integer(int column) const;
    std::string text(int column) const;
    /// Valid until the next step() or reset().
    std::string_view textView(int column) const;
    bool isNull(int column) const;

private:
    int inRow(int column) const;

    Database *database_;
    Statement statement_;
};

} // namespace Sqlite
