// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace Sqlite {

class Database;

/// A transaction that rolls back unless it was committed. Queries made inside it must be gone, reset or at their end
/// before the commit.
class Transaction {
public:
    enum class Kind {
        Write, ///< takes the writer's lock at once (BEGIN IMMEDIATE), so that it cannot lose a race half-way
        Read,  ///< several queries that must see one state
    };

    explicit Transaction(Database &database, Kind kind = Kind::Write);
    ~Transaction();
    Transaction(Transaction const &) = delete;
    Transaction &operator=(Transaction const &) = delete;

    /// Durable when it returns. When it throws, the transaction is rolled back.
    void commit();

private:
    Database *database_;
};

} // namespace Sqlite
