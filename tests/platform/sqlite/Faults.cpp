// SPDX-License-Identifier: Apache-2.0
//
// Damage, locks, full disks and killed writers.
#include "Fixture.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <filesystem>
#include <optional>
#include <system_error>

#include <sqlite3.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include "sqlite/Transaction.h"

namespace {

using Sqlite::Database;
using Sqlite::ErrorKind;
using Sqlite::Mode;
using Sqlite::Transaction;

/// While it lasts, this process can open nothing more.
class NoDescriptors {
public:
    NoDescriptors() {
        ::getrlimit(RLIMIT_NOFILE, &before_);
        rlimit none = before_;
        int const next = ::dup(0);
        none.rlim_cur = static_cast<rlim_t>(next);
        ::close(next);
        ::setrlimit(RLIMIT_NOFILE, &none);
    }
    ~NoDescriptors() {
        end();
    }
    void end() {
        ::setrlimit(RLIMIT_NOFILE, &before_);
    }

private:
    rlimit before_{};
};

/// Root may write everything; while it lasts, root is somebody else.
class Unprivileged {
public:
    Unprivileged()
        : before_(::geteuid()) {
        if (before_ == 0 && ::seteuid(65534) != 0) {
            throw std::system_error(errno, std::generic_category(), "seteuid");
        }
    }
    ~Unprivileged() {
        EXPECT_EQ(::seteuid(before_), 0);
    }
    Unprivileged(Unprivileged const &) = delete;
    Unprivileged &operator=(Unprivileged const &) = delete;

private:
    uid_t before_;
};

class FaultTest : public SqliteTest {
protected:
    /// Leaves a file of 20 rows whose next transaction was killed after parts of it had reached the file.
    void leaveHotJournal() {
        makeFile("a.db", 20);
        runAndKill([&] {
            static Database database(at("a.db"), kind(), Mode::ReadWrite);
            database.execute("PRAGMA cache_size=1; BEGIN IMMEDIATE; UPDATE item SET text = zeroblob(0) || id || text;"
                             "DELETE FROM item WHERE id > 3");
        });
        ASSERT_FALSE(bytesOf(at("a.db-journal")).empty());
    }

    void expectCannotBeWritten(std::optional<Sqlite::Error> const &error) const {
        ASSERT_TRUE(error);
        EXPECT_EQ(error->kind(), ErrorKind::ReadOnly);
        EXPECT_EQ(error->sentence(), "the test file '" + at("a.db") +
                                         "' cannot be written: it, its directory or its file system is read-only");
    }
};

TEST_F(FaultTest, fault_48_FlippedBytesAreNamedAndNothingIsOverwritten) {
    std::string bytes = bytesOf(makeFile("a.db", 50));
    for (std::size_t i = 4096; i < bytes.size(); ++i) {
        bytes[i] = static_cast<char>(~bytes[i]);
    }
    writeBytes(at("a.db"), bytes);
    Database database(at("a.db"), kind(), Mode::ReadWrite);
    auto const read = errorOf([&] { countItems(database); });
    ASSERT_TRUE(read);
    EXPECT_EQ(read->kind(), ErrorKind::Malformed);
    EXPECT_NE(read->sentence().find(at("a.db")), std::string::npos);
    auto const written = errorOf([&] { database.query("INSERT INTO item (text) VALUES ('x')").run(); });
    ASSERT_TRUE(written);
    EXPECT_EQ(written->kind(), ErrorKind::Malformed);
    EXPECT_EQ(bytesOf(at("a.db")), bytes);
}

TEST_F(FaultTest, fault_48_ACutFileIsNamed) {
    std::string const bytes = bytesOf(makeFile("a.db", 50));
    writeBytes(at("a.db"), bytes.substr(0, 8192));
    auto const error = errorOf([&] {
        Database database(at("a.db"), kind(), Mode::ReadWrite);
        countItems(database);
    });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Malformed) << error->sentence();
}

TEST_F(FaultTest, fault_62_WithoutADescriptorAFileCannotBeOpenedOrWritten) {
    makeFile("a.db");
    Database database(at("a.db"), kind(), Mode::ReadWrite);
    NoDescriptors none;
    auto const opened = errorOf([&] { Database(at("a.db"), kind(), Mode::ReadWrite); });
    auto const written = errorOf([&] { database.query("INSERT INTO item (text) VALUES ('x')").run(); });
    none.end();
    ASSERT_TRUE(opened && written);
    EXPECT_EQ(opened->kind(), ErrorKind::Io);
    EXPECT_EQ(opened->sentence(), "the test file '" + at("a.db") + "' cannot be opened: unable to open database file");
    EXPECT_EQ(written->kind(), ErrorKind::Io);
    EXPECT_EQ(written->sentence(), "the test file '" + at("a.db") + "' cannot be written: its journal cannot be made");
    EXPECT_EQ(countItems(database), 1);
    database.query("INSERT INTO item (text) VALUES ('x')").run();
    EXPECT_EQ(countItems(database), 2);
}

TEST_F(FaultTest, fault_50_AJournalThatCannotBeMadeInAReadOnlyDirectoryIsNotCalledAnIoError) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    ASSERT_EQ(::chmod(directory_.c_str(), 0555), 0);
    // SQLite tells a directory that may not be written only by EACCES, and there are more ways to be refused.
    std::optional<Unprivileged> unprivileged(std::in_place);
    NoDescriptors none;
    auto const error = errorOf([&] { database.query("DELETE FROM item").run(); });
    none.end();
    unprivileged.reset();
    ::chmod(directory_.c_str(), 0755);
    expectCannotBeWritten(error);
    EXPECT_EQ(countItems(database), 1);
}

TEST_F(FaultTest, fault_48_AnIntegrityCheckFindsWhatNobodyReadYet) {
    makeFile("a.db", 50);
    Database(at("a.db"), kind(), Mode::QueryOnly).checkIntegrity();
    std::string bytes = bytesOf(at("a.db"));
    bytes.replace(bytes.size() - 4096, 64, std::string(64, '\x7f'));
    writeBytes(at("a.db"), bytes);
    Database database(at("a.db"), kind(), Mode::QueryOnly);
    EXPECT_EQ(errorOf([&] { database.checkIntegrity(); })->kind(), ErrorKind::Malformed);
}

TEST_F(FaultTest, fault_49_BusyAfterTheTimeout) {
    Database holder(makeFile("a.db"), kind(), Mode::ReadWrite);
    Transaction const held(holder);
    Database waiter(at("a.db"), kind(), Mode::ReadWrite, {std::chrono::milliseconds{60}});
    auto const begin = std::chrono::steady_clock::now();
    auto const error = errorOf([&] { Transaction transaction(waiter); });
    auto const waited = std::chrono::steady_clock::now() - begin;
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Busy);
    EXPECT_EQ(error->sentence(),
              "the test file '" + at("a.db") + "' is busy: another process has held its lock for 60 ms");
    EXPECT_GE(waited, std::chrono::milliseconds{50});
    EXPECT_EQ(countItems(waiter), 1);
}

TEST_F(FaultTest, fault_49_AnEventLoopNeverWaits) {
    Database holder(makeFile("a.db"), kind(), Mode::ReadWrite);
    Database reader(at("a.db"), kind(), Mode::QueryOnly, {std::chrono::milliseconds{0}});
    holder.execute("BEGIN EXCLUSIVE");
    auto const error = errorOf([&] { countItems(reader); });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Busy);
    EXPECT_EQ(error->sentence(), "the test file '" + at("a.db") + "' is busy: another process is changing it");
    holder.execute("ROLLBACK");
    EXPECT_EQ(countItems(reader), 1);
}

TEST_F(FaultTest, fault_49_ACommitThatMeetsAReaderRollsBack) {
    Database reader(makeFile("a.db"), kind(), Mode::QueryOnly);
    Database writer(at("a.db"), kind(), Mode::ReadWrite, {std::chrono::milliseconds{0}});
    {
        Transaction const reading(reader, Transaction::Kind::Read);
        ASSERT_EQ(countItems(reader), 1);
        auto const error = errorOf([&] {
            Transaction transaction(writer);
            writer.query("DELETE FROM item").run();
            transaction.commit();
        });
        ASSERT_TRUE(error);
        EXPECT_EQ(error->kind(), ErrorKind::Busy);
    }
    EXPECT_EQ(countItems(writer), 1);
    writer.query("DELETE FROM item").run();
    EXPECT_EQ(countItems(reader), 0);
}

TEST_F(FaultTest, fault_46_AFullDiskRollsBackAndReadsGoOn) {
    Database database(makeFile("a.db", 5), kind(), Mode::ReadWrite);
    database.execute("PRAGMA max_page_count=3");
    auto const error = errorOf([&] {
        Transaction transaction(database);
        for (int i = 0; i < 100; ++i) {
            database.query("INSERT INTO item (text) VALUES (?1)").bind(1, std::string(500, 'y')).run();
        }
        transaction.commit();
    });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::DiskFull);
    EXPECT_EQ(countItems(database), 5);
    database.query("DELETE FROM item WHERE id = 1").run();
    EXPECT_EQ(countItems(database), 4);
}

/// Removes a file and then fails to sync its directory.
int removeWithoutSync(sqlite3_vfs *, char const *name, int syncsDirectory) {
    sqlite3_vfs *const real = sqlite3_vfs_find("unix");
    int const result = real->xDelete(real, name, 0);
    return result == SQLITE_OK && syncsDirectory != 0 ? SQLITE_IOERR_DIR_FSYNC : result;
}

TEST_F(FaultTest, fault_47_ADirectoryThatCannotBeSyncedIsNotCalledUnchanged) {
    makeFile("a.db");
    sqlite3_vfs *const real = sqlite3_vfs_find("unix");
    sqlite3_vfs failing = *real;
    failing.zName = "failing";
    failing.xDelete = removeWithoutSync;
    sqlite3_vfs_register(&failing, 1);
    auto const error = errorOf([&] {
        Database database(at("a.db"), kind(), Mode::ReadWrite);
        database.query("INSERT INTO item (text) VALUES ('x')").run();
    });
    sqlite3_vfs_unregister(&failing);
    sqlite3_vfs_register(real, 1);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Io);
    EXPECT_EQ(error->sentence().find("the test file '" + at("a.db") + "' was changed, but perhaps not durably: "), 0U)
        << error->sentence();
    Database database(at("a.db"), kind(), Mode::ReadWrite);
    EXPECT_EQ(countItems(database), 2);
}

TEST_F(FaultTest, fault_50_AReadOnlyFileStillReads) {
    makeFile("a.db", 2);
    ASSERT_EQ(::chmod(at("a.db").c_str(), 0444), 0);
    ASSERT_EQ(::chmod(directory_.c_str(), 0555), 0);
    std::optional<Unprivileged> unprivileged(std::in_place);
    for (Mode const mode : {Mode::Create, Mode::ReadWrite, Mode::QueryOnly}) {
        std::optional<Sqlite::Error> error;
        EXPECT_NO_THROW({
            Database database(at("a.db"), kind(), mode);
            EXPECT_EQ(countItems(database), 2);
            error = errorOf([&] { database.query("DELETE FROM item").run(); });
        });
        ASSERT_TRUE(error);
        EXPECT_EQ(error->kind(), ErrorKind::ReadOnly) << error->sentence();
    }
    auto const made = errorOf([&] { Database(at("b.db"), kind(), Mode::Create); });
    unprivileged.reset();
    ::chmod(directory_.c_str(), 0755);
    ASSERT_TRUE(made);
    EXPECT_EQ(made->kind(), ErrorKind::ReadOnly) << made->sentence();
}

TEST_F(FaultTest, fault_50_AFileInADirectoryWithoutRoomForAJournalStillReads) {
    makeFile("a.db", 2);
    ASSERT_EQ(::chmod(at("a.db").c_str(), 0666), 0);
    ASSERT_EQ(::chmod(directory_.c_str(), 0555), 0);
    std::optional<Unprivileged> unprivileged(std::in_place);
    std::optional<Sqlite::Error> error;
    EXPECT_NO_THROW({
        Database database(at("a.db"), kind(), Mode::ReadWrite);
        error = errorOf([&] { database.query("DELETE FROM item").run(); });
        EXPECT_EQ(countItems(database), 2);
    });
    unprivileged.reset();
    ::chmod(directory_.c_str(), 0755);
    expectCannotBeWritten(error);
}

TEST_F(FaultTest, fault_52_AReaderRollsAKilledWriterBack) {
    leaveHotJournal();
    Database database(at("a.db"), kind(), Mode::QueryOnly);
    EXPECT_EQ(countItems(database), 20);
    Sqlite::Query lengths(database, "SELECT count(*) FROM item WHERE length(text) = 500");
    lengths.step();
    EXPECT_EQ(lengths.integer(0), 20);
    EXPECT_FALSE(exists(at("a.db-journal")));
}

TEST_F(FaultTest, fault_52_AWriterRollsAKilledWriterBack) {
    leaveHotJournal();
    Database database(at("a.db"), kind(), Mode::Create);
    database.query("INSERT INTO item (text) VALUES ('after')").run();
    EXPECT_EQ(countItems(database), 21);
    database.checkIntegrity();
}

TEST_F(FaultTest, fault_27_AMakingThatFailsLeavesNoHalfMadeFile) {
    auto bad = kind();
    bad.schema += "CREATE TABLE filler (a BLOB) STRICT; SELECT no_such_function()";
    EXPECT_TRUE(errorOf([&] { Database(at("a.db"), bad, Mode::Create); }));
    EXPECT_EQ(errorOf([&] { Database(at("a.db"), kind(), Mode::QueryOnly); })->kind(), ErrorKind::Missing);
    Database database(at("a.db"), kind(), Mode::Create);
    EXPECT_EQ(countItems(database), 0);
}

TEST_F(FaultTest, fault_27_AFileThatWasKilledWhileBeingMadeIsMadeAgain) {
    // Page 1, with our identity in it, has reached the file; the journal that takes it back stands beside it.
    std::string const made = bytesOf(makeFile("made.db", 0));
    runAndKill([&] {
        sqlite3 *handle = nullptr;
        sqlite3_open(at("a.db").c_str(), &handle);
        sqlite3_exec(handle, "PRAGMA cache_size=1; BEGIN; CREATE TABLE t (a); INSERT INTO t VALUES (zeroblob(200000))",
                     nullptr, nullptr, nullptr);
    });
    ASSERT_FALSE(bytesOf(at("a.db-journal")).empty());
    std::string bytes = bytesOf(at("a.db"));
    bytes.resize(std::max(bytes.size(), made.size()));
    std::copy(made.begin(), made.begin() + 4096, bytes.begin());
    writeBytes(at("a.db"), bytes);

    EXPECT_EQ(errorOf([&] { Database(at("a.db"), kind(), Mode::QueryOnly); })->kind(), ErrorKind::Missing);
    Database database(at("a.db"), kind(), Mode::Create);
    EXPECT_EQ(countItems(database), 0);
}

} // namespace
