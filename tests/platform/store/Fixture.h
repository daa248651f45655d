// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <optional>
#include <string>

#include <gtest/gtest.h>

#include "store/HostStore.h"
#include "wire/Failure.h"

/// A root directory of its own for each test.
class StoreTest : public ::testing::Test {
protected:
    StoreTest();
    ~StoreTest() override;

    std::string file() const {
        return root_ + "/host.db";
    }
    /// Runs statements on a connection of plain SQLite.
    void plainSql(std::string const &sql) const;

    std::string directory_;
    /// Does not exist at first.
    std::string root_;
};

/// The failure that an operation ends with; none when it succeeds.
std::optional<Wire::Failure> failureOf(std::function<void()> const &operation);
std::string bytesOf(std::string const &path);
bool exists(std::string const &path);
