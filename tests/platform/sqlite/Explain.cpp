// SPDX-License-Identifier: Apache-2.0
//
// What users are told for what SQLite says.
#include "Explain.h"

#include <cerrno>
#include <new>

#include <gtest/gtest.h>
#include <sqlite3.h>

namespace {

using Sqlite::ErrorKind;
using namespace std::chrono_literals;

TEST(Explain, EveryResultHasAKindAndASentence) {
    struct Row {
        int code;
        int systemError;
        ErrorKind kind;
        char const *sentence;
    };
    constexpr Row rows[] = {
        {SQLITE_BUSY, 0, ErrorKind::Busy, "it is busy: another process has held its lock for 50 ms"},
        {SQLITE_BUSY_SNAPSHOT, 0, ErrorKind::Busy, "it is busy: another process has held its lock for 50 ms"},
        {SQLITE_LOCKED, 0, ErrorKind::Busy, "it is busy: another process has held its lock for 50 ms"},
        {SQLITE_CORRUPT, 0, ErrorKind::Malformed, "it is damaged: words"},
        {SQLITE_NOTADB, 0, ErrorKind::Malformed, "it is damaged: words"},
        {SQLITE_READONLY, 0, ErrorKind::ReadOnly,
         "it cannot be written: it, its directory or its file system is read-only"},
        {SQLITE_PERM, 0, ErrorKind::ReadOnly,
         "it cannot be written: it, its directory or its file system is read-only"},
        {SQLITE_TOOBIG, 0, ErrorKind::Malformed, "it cannot be used: a row of it is longer than 2 MiB"},
        {SQLITE_FULL, 0, ErrorKind::DiskFull, "it cannot be written: the disk is full; it was not changed"},
        {SQLITE_IOERR_WRITE, ENOSPC, ErrorKind::DiskFull, "it cannot be written: the disk is full; it was not changed"},
        {SQLITE_IOERR_WRITE, EDQUOT, ErrorKind::DiskFull, "it cannot be written: the disk is full; it was not changed"},
        {SQLITE_IOERR_WRITE, EIO, ErrorKind::Io, "it cannot be read or written: Input/output error"},
        {SQLITE_IOERR_WRITE, 0, ErrorKind::Io, "it cannot be read or written: words"},
        {SQLITE_IOERR_FSYNC, EIO, ErrorKind::Io, "it cannot be written durably: Input/output error"},
        {SQLITE_IOERR_READ, EIO, ErrorKind::Io, "it cannot be read: Input/output error"},
        {SQLITE_IOERR_SHORT_READ, 0, ErrorKind::Io, "it cannot be read: words"},
        {SQLITE_IOERR_DIR_FSYNC, EIO, ErrorKind::Io, "it was changed, but perhaps not durably: Input/output error"},
        {SQLITE_IOERR_DIR_FSYNC, 0, ErrorKind::Io,
         "it was changed, but perhaps not durably: its directory cannot be synced"},
        {SQLITE_CANTOPEN, ENOENT, ErrorKind::Missing, "it cannot be opened: No such file or directory"},
        {SQLITE_CANTOPEN, EACCES, ErrorKind::Io, "it cannot be opened: Permission denied"},
        {SQLITE_CONSTRAINT_UNIQUE, 0, ErrorKind::Constraint, "it refuses the change: words"},
        {SQLITE_ERROR, 0, ErrorKind::Other, "it cannot be used: words"},
    };
    for (Row const &row : rows) {
        Sqlite::Error const error = Sqlite::explain(row.code, row.systemError, "words", "it", 50ms);
        EXPECT_EQ(error.kind(), row.kind) << row.sentence;
        EXPECT_EQ(error.sentence(), row.sentence);
    }
    EXPECT_EQ(Sqlite::explain(SQLITE_BUSY, 0, "words", "it", 0ms).sentence(),
              "it is busy: another process is changing it");
}

TEST(Explain, MemoryThatRanOutIsNoErrorOfTheFile) {
    EXPECT_THROW(Sqlite::explain(SQLITE_NOMEM, 0, "words", "it", 0ms), std::bad_alloc);
    EXPECT_THROW(Sqlite::explain(SQLITE_IOERR_NOMEM, 0, "words", "it", 0ms), std::bad_alloc);
}

TEST(Explain, AFileWithoutAKindIsADatabase) {
    EXPECT_EQ(Sqlite::named("", "/a.db"), "the database '/a.db'");
    EXPECT_EQ(Sqlite::named("the host store", "/a.db"), "the host store '/a.db'");
}

} // namespace
