// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include <sqlite3.h>

StoreTest::StoreTest() {
    std::string pattern = (std::filesystem::temp_directory_path() / "tovi-store-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    directory_ = pattern;
    root_ = directory_ + "/some/root";
}

StoreTest::~StoreTest() {
    std::filesystem::remove_all(directory_);
}

void StoreTest::plainSql(std::string const &sql) const {
    sqlite3 *handle = nullptr;
    ASSERT_EQ(sqlite3_open(file().c_str(), &handle), SQLITE_OK);
    EXPECT_EQ(sqlite3_exec(handle, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK) << sqlite3_errmsg(handle);
    sqlite3_close(handle);
}

std::optional<Wire::Failure> failureOf(std::function<void()> const &operation) {
    try {
        operation();
    } catch (Wire::Failure const &failure) {
        return failure;
    }
    return std::nullopt;
}

std::string bytesOf(std::string const &path) {
    std::ostringstream bytes;
    bytes << std::ifstream(path, std::ios::binary).rdbuf();
    return bytes.str();
}

bool exists(std::string const &path) {
    return std::filesystem::exists(path);
}
