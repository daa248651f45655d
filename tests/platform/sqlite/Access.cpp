// SPDX-License-Identifier: Apache-2.0
//
// Queries, transactions, and what one connection sees of another.
#include "Fixture.h"

#include <filesystem>

#include "sqlite/Transaction.h"

namespace {

using Sqlite::Database;
using Sqlite::ErrorKind;
using Sqlite::Mode;
using Sqlite::Query;
using Sqlite::Transaction;

using AccessTest = SqliteTest;

std::string pragma(Database &database, std::string const &name) {
    Query query(database, "PRAGMA " + name);
    query.step();
    return query.text(0);
}

TEST_F(AccessTest, SetsEveryConnectionUpForDurability) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    EXPECT_EQ(pragma(database, "journal_mode"), "delete");
    EXPECT_EQ(pragma(database, "synchronous"), "3");
    EXPECT_EQ(pragma(database, "foreign_keys"), "1");
    EXPECT_EQ(pragma(database, "temp_store"), "2");
    EXPECT_EQ(pragma(database, "busy_timeout"), "5000");
    EXPECT_EQ(pragma(database, "query_only"), "0");
}

TEST_F(AccessTest, KeepsAsMuchOfAFileAsItIsTold) {
    Sqlite::Options options;
    options.cacheKib = 8192;
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite, options);
    EXPECT_EQ(pragma(database, "cache_size"), "-8192");
    Database usual(at("a.db"), kind(), Mode::ReadWrite);
    EXPECT_EQ(pragma(usual, "cache_size"), "-2000");
}

TEST_F(AccessTest, RefusesALinkWhereItIsToldTo) {
    makeFile("a.db");
    std::filesystem::create_symlink("a.db", at("link.db"));
    std::filesystem::create_symlink("none.db", at("dangling.db"));
    EXPECT_EQ(countItems(*std::make_unique<Database>(at("link.db"), kind(), Mode::ReadWrite)), 1);
    Sqlite::Options options;
    options.refusesLink = true;
    for (Mode const mode : {Mode::Create, Mode::ReadWrite, Mode::QueryOnly}) {
        for (std::string const &path : {at("link.db"), at("dangling.db")}) {
            auto const error = errorOf([&] { Database(path, kind(), mode, options); });
            ASSERT_TRUE(error);
            EXPECT_EQ(error->kind(), ErrorKind::Io);
            EXPECT_EQ(error->sentence(),
                      "the test file '" + path + "' is a symbolic link, which is not followed; it was left as it is");
        }
    }
    EXPECT_FALSE(exists(at("none.db")));
    // A link that leads to the directory is nobody's but the caller's.
    std::filesystem::create_directory_symlink(directory_, at("here"));
    Database database(at("here/a.db"), kind(), Mode::ReadWrite, options);
    EXPECT_EQ(countItems(database), 1);
    auto const error = errorOf([&] { Database(at("nowhere/a.db"), kind(), Mode::ReadWrite, options); });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Missing);
}

TEST_F(AccessTest, TakesAFileBackOutOfAnotherJournalMode) {
    plainSql(makeFile("a.db"), "PRAGMA journal_mode=WAL");
    Database database(at("a.db"), kind(), Mode::ReadWrite);
    EXPECT_EQ(pragma(database, "journal_mode"), "delete");
    EXPECT_EQ(countItems(database), 1);
}

TEST_F(AccessTest, QueryOnlyReadsAndNeverWrites) {
    Database database(makeFile("a.db"), kind(), Mode::QueryOnly);
    EXPECT_EQ(countItems(database), 1);
    std::string const before = bytesOf(at("a.db"));
    for (char const *sql : {"INSERT INTO item (text) VALUES ('x')", "DELETE FROM item", "DROP TABLE item"}) {
        auto const error = errorOf([&] { database.query(sql).run(); });
        ASSERT_TRUE(error) << sql;
        EXPECT_EQ(error->kind(), ErrorKind::ReadOnly) << error->sentence();
    }
    EXPECT_EQ(bytesOf(at("a.db")), before);
}

TEST_F(AccessTest, ValuesComeBackAsTheyWereBound) {
    Database database(at("a.db"), {1, 1, "CREATE TABLE v (i INTEGER, t TEXT, e TEXT, n TEXT) STRICT", "the file"},
                      Mode::Create);
    std::string const text = std::string("a\0b\xff\xc3\xa9", 6);
    database.query("INSERT INTO v VALUES (?1, ?2, ?3, ?4)")
        .bind(1, INT64_MIN)
        .bind(2, text)
        .bind(3, "")
        .bindNull(4)
        .run();
    Query row(database, "SELECT i, t, e, n FROM v");
    ASSERT_TRUE(row.step());
    EXPECT_EQ(row.integer(0), INT64_MIN);
    EXPECT_EQ(row.text(1), text);
    EXPECT_FALSE(row.isNull(2));
    EXPECT_EQ(row.text(2), "");
    EXPECT_TRUE(row.isNull(3));
    EXPECT_EQ(row.text(3), "");
    EXPECT_FALSE(row.step());
}

TEST_F(AccessTest, QueriesOfOneTextMayBeNested) {
    Database database(makeFile("a.db", 3), kind(), Mode::ReadWrite);
    int pairs = 0;
    Query(database, "SELECT id FROM item").run(); // one is kept, and one is not enough
    Query outer(database, "SELECT id FROM item");
    while (outer.step()) {
        Query inner(database, "SELECT id FROM item");
        while (inner.step()) {
            ++pairs;
        }
    }
    EXPECT_EQ(pairs, 9);
}

TEST_F(AccessTest, ARelativeNameIsAFileOfTheWorkingDirectory) {
    std::filesystem::path const before = std::filesystem::current_path();
    std::filesystem::current_path(directory_);
    {
        Database made(":memory:", kind(), Mode::Create);
        made.query("INSERT INTO item (text) VALUES ('x')").run();
        EXPECT_EQ(countItems(made), 1);
        std::filesystem::create_directory("taken.db");
        auto const error = errorOf([] { Database(std::string("taken.db"), kind(), Mode::Create); });
        ASSERT_TRUE(error);
        EXPECT_EQ(error->sentence(), "the test file 'taken.db' cannot be opened: Is a directory");
    }
    std::filesystem::current_path(before);
    EXPECT_TRUE(exists(at(":memory:")));
}

TEST_F(AccessTest, AWorkingDirectoryThatIsGoneIsNotCalledReadOnly) {
    std::filesystem::path const before = std::filesystem::current_path();
    std::filesystem::create_directory(at("gone"));
    std::filesystem::current_path(at("gone"));
    std::filesystem::remove(at("gone"));
    auto const error = errorOf([] { Database(std::string("a.db"), kind(), Mode::Create); });
    std::filesystem::current_path(before);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Missing);
    EXPECT_EQ(error->sentence(), "the test file 'a.db' cannot be opened: No such file or directory");
}

TEST_F(AccessTest, ADirectoryThatIsMissingIsNotCalledReadOnly) {
    auto const error = errorOf([&] { Database(at("none/a.db"), kind(), Mode::Create); });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Missing);
    EXPECT_EQ(error->sentence(), "the test file '" + at("none/a.db") + "' cannot be opened: No such file or directory");
}

TEST_F(AccessTest, ACachedStatementForgetsItsBindings) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    database.query("INSERT INTO item (text) VALUES (?1)").bind(1, "kept").run();
    database.query("INSERT INTO item (text) VALUES (?1)").run();
    Query row(database, "SELECT text FROM item ORDER BY id DESC LIMIT 1");
    ASSERT_TRUE(row.step());
    EXPECT_TRUE(row.isNull(0));
}

TEST_F(AccessTest, ReadingOutsideARowIsAnErrorOfOurs) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    std::string const sentence = "the test file '" + at("a.db") + "' cannot be used: a query has no row with a column ";
    Query row(database, "SELECT id FROM item");
    EXPECT_EQ(errorOf([&] { row.integer(0); })->sentence(), sentence + "0");
    ASSERT_TRUE(row.step());
    EXPECT_EQ(errorOf([&] { row.text(1); })->sentence(), sentence + "1");
    EXPECT_EQ(errorOf([&] { row.isNull(-1); })->sentence(), sentence + "-1");
    EXPECT_TRUE(errorOf([&] { database.query("SELECT nothing FROM nowhere"); }));
}

TEST_F(AccessTest, ATransactionRollsBackUnlessCommitted) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    {
        Transaction transaction(database);
        database.query("DELETE FROM item").run();
    }
    EXPECT_EQ(countItems(database), 1);
    {
        Transaction transaction(database);
        database.query("DELETE FROM item").run();
        transaction.commit();
    }
    EXPECT_EQ(countItems(database), 0);
}

TEST_F(AccessTest, AFailureInsideATransactionUndoesAllOfIt) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    auto const error = errorOf([&] {
        Transaction transaction(database);
        database.query("INSERT INTO item (id) VALUES (2)").run();
        database.query("INSERT INTO item (id) VALUES (1)").run();
        transaction.commit();
    });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Constraint);
    EXPECT_EQ(countItems(database), 1);
}

TEST_F(AccessTest, AReadTransactionSeesOneState) {
    Database reader(makeFile("a.db"), kind(), Mode::QueryOnly);
    Database writer(at("a.db"), kind(), Mode::ReadWrite, {std::chrono::milliseconds{0}});
    Transaction const oneState(reader, Transaction::Kind::Read);
    EXPECT_EQ(countItems(reader), 1);
    EXPECT_EQ(errorOf([&] { writer.query("DELETE FROM item").run(); })->kind(), ErrorKind::Busy);
    EXPECT_EQ(countItems(reader), 1);
}

TEST_F(AccessTest, DataVersionTellsOfOthersCommits) {
    Database watcher(makeFile("a.db"), kind(), Mode::QueryOnly);
    Database writer(at("a.db"), kind(), Mode::ReadWrite);
    int64_t const before = watcher.dataVersion();
    EXPECT_EQ(watcher.dataVersion(), before);
    writer.query("DELETE FROM item").run();
    EXPECT_NE(watcher.dataVersion(), before);
}

TEST_F(AccessTest, NoticesThatItsFileIsNoLongerAtItsPath) {
    Database database(makeFile("a.db"), kind(), Mode::ReadWrite);
    EXPECT_FALSE(database.hasMoved());
    std::filesystem::rename(at("a.db"), at("b.db"));
    EXPECT_TRUE(database.hasMoved());
    makeFile("a.db");
    EXPECT_TRUE(database.hasMoved());
}

TEST_F(AccessTest, TwoWritersGoOneAfterTheOther) {
    Database first(makeFile("a.db", 0), kind(), Mode::ReadWrite);
    Database second(at("a.db"), kind(), Mode::ReadWrite);
    for (int i = 0; i < 20; ++i) {
        (i % 2 == 0 ? first : second).query("INSERT INTO item (text) VALUES ('x')").run();
    }
    EXPECT_EQ(countItems(first), 20);
    EXPECT_EQ(countItems(second), 20);
}

} // namespace
