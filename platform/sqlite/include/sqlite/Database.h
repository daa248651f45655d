// SPDX-License-Identifier: Apache-2.0
//
// How every database file of ours is opened, so that all of them are equally safe.
//
// A file carries an identity: an application id that says whose it is and a user version that says how it is laid out.
// A file of somebody else, of a newer version of ours, or that is no database is refused before anything could change a
// byte of it. What is committed is durable when the commit returns (rollback journal, synchronous=EXTRA: the journal's
// directory entry is synced too); what was not committed when a process was killed is rolled back by whoever opens the
// file next, a reader included. Waiting for another process's lock ends after the busy timeout with ErrorKind::Busy.
//
// Called by the host store and by the array file. A database, its queries and its transactions belong to one thread at
// a time. Everything throws Sqlite::Error.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "sqlite/Error.h"
#include "sqlite/Query.h"

struct sqlite3;
struct sqlite3_stmt;

namespace Sqlite {

/// What makes a file one of ours of a certain kind.
struct Identity {
    /// Not 0, which is what a database of nobody carries.
    int32_t applicationId = 0;
    /// Starts at 1. A file of a higher version is refused; there are no older ones yet.
    int32_t userVersion = 0;
    /// Statements that make the empty layout; every table STRICT.
    std::string schema;
    /// For sentences, with its article: "the host store".
    std::string kindName;
    /// A file that comes from others may say that it is one of ours and hold a view that never ends in the place of a
    /// table. Where this is set, one that does not hold exactly what the schema makes is Malformed, and so is one with
    /// a row of more than 2 MiB.
    bool isFromOthers = false;
};

enum class Mode {
    Create,    ///< reads and writes; makes the file and its layout, in one durable step, when it is missing or empty
    ReadWrite, ///< reads and writes; the file must exist
    /// Reads; the file must exist and is never made. The handle can write all the same, because a reader that could not
    /// would be unable to roll back what a killed writer left behind; query_only keeps every statement from writing.
    QueryOnly,
};

struct Options {
    /// How long a statement waits for another process's lock. 0 never waits, which an event loop wants.
    std::chrono::milliseconds busyTimeout{5000};
    /// How much of the file is kept in memory at most, in KiB, taken as pages are read; nothing: SQLite's own 2000.
    std::optional<int> cacheKib = std::nullopt;
    /// Whether a symbolic link in the place of the file is refused. Links that lead to its directory are followed.
    bool refusesLink = false;
};

class Database {
public:
    /// Opens the file, checks its identity and sets up the connection. A file on a read-only file system opens in every
    /// mode; a write then fails with ErrorKind::ReadOnly.
    Database(std::string const &path, Identity const &identity, Mode mode, Options const &options = {});
    ~Database();
    Database(Database const &) = delete;
    Database &operator=(Database const &) = delete;

    /// A prepared statement, taken from a cache keyed by its text and returned to it when the query goes; keep the
    /// texts fixed and bind what varies. The query must not outlive the database.
    Query query(std::string_view sql);
    /// Runs one or several statements that return nothing, uncached.
    void execute(std::string const &sql);

    int64_t lastInsertId() const;
    /// Rows that the latest INSERT, UPDATE or DELETE touched.
    int64_t changes() const;
    /// Changes when another connection has committed since the last call; a commit of this one does not change it.
    int64_t dataVersion();
    /// Whether the path no longer leads to the file that is open (removed, or replaced by another).
    bool hasMoved() const;
    /// Reads the whole file; throws ErrorKind::Malformed naming the first damage. Takes time in proportion to its size.
    void checkIntegrity();

    std::string const &path() const noexcept {
        return path_;
    }

private:
    friend class Query;
    friend class Transaction;
    struct Close {
        void operator()(sqlite3 *handle) const noexcept;
    };
    struct TextHash {
        using is_transparent = void;
        std::size_t operator()(std::string_view text) const noexcept {
            return std::hash<std::string_view>()(text);
        }
    };

    void open(Options const &options, bool openedAgain);
    void checkIdentity();
    void checkLayout();
    void configure(Options const &options);
    void createLayout();
    Statement take(std::string_view sql);
    void giveBack(Statement statement) noexcept;
    /// Throws what went wrong last on the handle, unless the code says that nothing did.
    void check(int code) const;
    [[noreturn]] void fail() const;

    std::string path_;
    Identity identity_;
    Mode mode_;
    std::chrono::milliseconds busyTimeout_;
    std::unique_ptr<sqlite3, Close> handle_;
    /// Statements that no query uses now; several of one text when queries of it were nested. They go before the
    /// handle.
    std::unordered_map<std::string, std::vector<Statement>, TextHash, std::equal_to<>> idle_;
};

} // namespace Sqlite
