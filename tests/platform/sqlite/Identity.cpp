// SPDX-License-Identifier: Apache-2.0
//
// Whose file it is: what opens, what is made, and what is refused without a byte of it changing.
#include "Fixture.h"

#include <filesystem>

namespace {

using Sqlite::Database;
using Sqlite::ErrorKind;
using Sqlite::Mode;

class IdentityTest : public SqliteTest {
protected:
    /// Opens in every mode; each must refuse with that kind, name the path, and leave the directory as it was.
    void expectRefused(std::string const &path, ErrorKind expected, std::string const &words) {
        std::string const before = bytesOf(path);
        std::string const journalBefore = bytesOf(path + "-journal");
        auto const stamp = std::filesystem::last_write_time(path);
        for (Mode const mode : {Mode::Create, Mode::ReadWrite, Mode::QueryOnly}) {
            auto const error = errorOf([&] { Database(path, kind(), mode); });
            ASSERT_TRUE(error);
            EXPECT_EQ(error->kind(), expected) << error->sentence();
            EXPECT_NE(error->sentence().find(path), std::string::npos) << error->sentence();
            EXPECT_NE(error->sentence().find(words), std::string::npos) << error->sentence();
        }
        EXPECT_EQ(bytesOf(path), before);
        EXPECT_EQ(bytesOf(path + "-journal"), journalBefore);
        EXPECT_EQ(std::filesystem::last_write_time(path), stamp);
        EXPECT_FALSE(exists(path + "-wal"));
    }
};

TEST_F(IdentityTest, CreatesTheFileWithItsLayoutAndOpensItAgain) {
    makeFile("a.db");
    Database database(at("a.db"), kind(), Mode::ReadWrite);
    EXPECT_EQ(countItems(database), 1);
    EXPECT_FALSE(exists(at("a.db-journal")));
}

TEST_F(IdentityTest, CreateOpensAnExistingFileWithoutTouchingItsRows) {
    makeFile("a.db", 5);
    Database database(at("a.db"), kind(), Mode::Create);
    EXPECT_EQ(countItems(database), 5);
}

TEST_F(IdentityTest, OnlyCreateMakesAFile) {
    for (Mode const mode : {Mode::ReadWrite, Mode::QueryOnly}) {
        auto const error = errorOf([&] { Database(at("a.db"), kind(), mode); });
        ASSERT_TRUE(error);
        EXPECT_EQ(error->kind(), ErrorKind::Missing);
        EXPECT_EQ(error->sentence(), "the test file '" + at("a.db") + "' does not exist");
        EXPECT_FALSE(exists(at("a.db")));
    }
}

TEST_F(IdentityTest, AnEmptyFileIsOneThatWasNeverFinished) {
    writeBytes(at("a.db"), "");
    EXPECT_EQ(errorOf([&] { Database(at("a.db"), kind(), Mode::QueryOnly); })->kind(), ErrorKind::Missing);
    EXPECT_EQ(bytesOf(at("a.db")), "");
    Database database(at("a.db"), kind(), Mode::Create);
    EXPECT_EQ(countItems(database), 0);
}

TEST_F(IdentityTest, AFileInAMissingDirectoryIsMissing) {
    auto const error = errorOf([&] { Database(at("none/a.db"), kind(), Mode::Create); });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Missing);
    EXPECT_NE(error->sentence().find("No such file or directory"), std::string::npos) << error->sentence();
}

TEST_F(IdentityTest, ADirectoryIsNoFile) {
    std::filesystem::create_directory(at("a.db"));
    auto const error = errorOf([&] { Database(at("a.db"), kind(), Mode::Create); });
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Io);
    EXPECT_NE(error->sentence().find("Is a directory"), std::string::npos) << error->sentence();
}

TEST_F(IdentityTest, fault_51_RefusesTheFileOfAnotherProgram) {
    plainSql(at("a.db"), "PRAGMA application_id=7; PRAGMA user_version=3; CREATE TABLE item (id INTEGER PRIMARY KEY)");
    expectRefused(at("a.db"), ErrorKind::Foreign, "another program (application id 7)");
}

TEST_F(IdentityTest, fault_51_RefusesADatabaseOfNobody) {
    plainSql(at("a.db"), "CREATE TABLE item (id INTEGER PRIMARY KEY)");
    expectRefused(at("a.db"), ErrorKind::Foreign, "another program");
}

TEST_F(IdentityTest, fault_51_RefusesANewerFile) {
    makeFile("a.db");
    plainSql(at("a.db"), "PRAGMA user_version=4");
    expectRefused(at("a.db"), ErrorKind::Newer, "newer version (layout 4, this program knows 3)");
}

TEST_F(IdentityTest, RefusesALayoutThatNeverWas) {
    makeFile("a.db");
    plainSql(at("a.db"), "PRAGMA user_version=0");
    expectRefused(at("a.db"), ErrorKind::Malformed, "layout 0");
}

TEST_F(IdentityTest, fault_51_RefusesAFileInAnotherJournalModeOfAnotherProgram) {
    plainSql(at("a.db"), "PRAGMA journal_mode=WAL; CREATE TABLE t (a)");
    expectRefused(at("a.db"), ErrorKind::Foreign, "another program");
}

TEST_F(IdentityTest, fault_48_RefusesWhatIsNoDatabase) {
    for (std::string const &bytes : {std::string("x"), std::string(99, 'a'), std::string(5000, 'b'),
                                     std::string(4096, '\0'), std::string("SQLite format 3")}) {
        writeBytes(at("a.db"), bytes);
        expectRefused(at("a.db"), ErrorKind::Malformed, "does not begin as a database file does");
    }
}

TEST_F(IdentityTest, fault_52_LeavesAForeignFilesHotJournalToItsOwner) {
    plainSql(at("a.db"), "PRAGMA application_id=7; CREATE TABLE t (a); INSERT INTO t VALUES (zeroblob(100000))");
    auto foreign = kind();
    foreign.applicationId = 7;
    foreign.userVersion = 0;
    runAndKill([&] {
        static Database database(at("a.db"), foreign, Mode::ReadWrite);
        database.execute("PRAGMA cache_size=1; BEGIN IMMEDIATE; UPDATE t SET a = randomblob(100000)");
    });
    ASSERT_FALSE(bytesOf(at("a.db-journal")).empty());
    expectRefused(at("a.db"), ErrorKind::Foreign, "another program");
}

TEST_F(IdentityTest, TreatsEveryNameAsAFile) {
    auto const before = std::filesystem::current_path();
    std::filesystem::current_path(directory_);
    for (std::string const name : {":memory:", "file:b.db?mode=memory", "plain.db"}) {
        Database(name, kind(), Mode::Create);
        EXPECT_TRUE(exists(name)) << name;
    }
    std::filesystem::current_path(before);
    EXPECT_EQ(errorOf([] { Database("", kind(), Mode::Create); })->kind(), ErrorKind::Missing);
    EXPECT_EQ(errorOf([&] { Database(at("a") + '\0' + "b", kind(), Mode::Create); })->kind(), ErrorKind::Missing);
}

} // namespace
