// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <optional>
#include <string>

#include <gtest/gtest.h>

#include "sqlite/Database.h"

/// A directory of its own for each test, and a small kind of file to keep in it.
class SqliteTest : public ::testing::Test {
protected:
    SqliteTest();
    ~SqliteTest() override;

    static Sqlite::Identity kind();
    std::string at(std::string const &name) const {
        return directory_ + '/' + name;
    }
    /// A file of our kind with rows 1 to `rows` of table item.
    std::string makeFile(std::string const &name, int rows = 1) const;

    std::string directory_;
};

std::string bytesOf(std::string const &path);
void writeBytes(std::string const &path, std::string const &bytes);
bool exists(std::string const &path);
/// Runs statements on a connection of plain SQLite.
void plainSql(std::string const &path, std::string const &sql);
int64_t countItems(Sqlite::Database &database);
/// The error that an operation ends with; none when it succeeds.
std::optional<Sqlite::Error> errorOf(std::function<void()> const &operation);
/// Runs an operation in a process of its own that is killed (SIGKILL) when the operation returns.
void runAndKill(std::function<void()> const &operation);
