// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

SqliteTest::SqliteTest() {
    std::string pattern = (std::filesystem::temp_directory_path() / "tovi-sqlite-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    directory_ = pattern;
}

SqliteTest::~SqliteTest() {
    std::filesystem::remove_all(directory_);
}

Sqlite::Identity SqliteTest::kind() {
    return {0x54657374, 3, "CREATE TABLE item (id INTEGER PRIMARY KEY, text TEXT) STRICT;", "the test file"};
}

std::string SqliteTest::makeFile(std::string const &name, int rows) const {
    Sqlite::Database database(at(name), kind(), Sqlite::Mode::Create);
    for (int i = 0; i < rows; ++i) {
        database.query("INSERT INTO item (text) VALUES (?1)").bind(1, std::string(500, 'x')).run();
    }
    return at(name);
}

std::string bytesOf(std::string const &path) {
    std::ostringstream bytes;
    bytes << std::ifstream(path, std::ios::binary).rdbuf();
    return bytes.str();
}

void writeBytes(std::string const &path, std::string const &bytes) {
    std::ofstream(path, std::ios::binary | std::ios::trunc) << bytes;
}

bool exists(std::string const &path) {
    return std::filesystem::exists(path);
}

void plainSql(std::string const &path, std::string const &sql) {
    sqlite3 *handle = nullptr;
    ASSERT_EQ(sqlite3_open(path.c_str(), &handle), SQLITE_OK);
    EXPECT_EQ(sqlite3_exec(handle, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK) << sqlite3_errmsg(handle);
    sqlite3_close(handle);
}

int64_t countItems(Sqlite::Database &database) {
    Sqlite::Query query(database, "SELECT count(*) FROM item");
    query.step();
    return query.integer(0);
}

std::optional<Sqlite::Error> errorOf(std::function<void()> const &operation) {
    try {
        operation();
    } catch (Sqlite::Error const &error) {
        return error;
    }
    return std::nullopt;
}

void runAndKill(std::function<void()> const &operation) {
    pid_t const child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        operation();
        ::kill(::getpid(), SIGKILL);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL) << "the child ended before its end";
}
