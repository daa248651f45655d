// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "FakeDaemon.h"
#include "gantry/Storage.h"
#include "kestrel/Storage.h"
#include "store/HostStore.h"

using FileSystemPointer = std::unique_ptr<Gantry::Storage::LumoFileSystem>;

inline std::string const containerId = "aaaaaaaa-1111-2222-3333-444444444444";
inline std::string const otherId = "bbbbbbbb-1111-2222-3333-444444444444";

/// A root of its own, a daemon on it that knows two containers, "gold" and "silver", and the host's storage interface.
class KestrelTest : public ::testing::Test {
protected:
    KestrelTest();
    ~KestrelTest() override;

    std::string at(std::string const &name) const {
        return root_ + '/' + name;
    }
    FileSystemPointer mountGold();
    std::vector<std::string> namesOfFileSystems();
    std::string createVolume(Gantry::Storage::LumoFileSystem &fileSystem, std::string const &name);
    /// What another process would read.
    Store::HostStore stored() const {
        return Store::HostStore(root_, Store::HostStore::Mode::QueryOnly);
    }

    std::string directory_;
    std::string root_;
    std::optional<FakeDaemon> daemon_;
    std::optional<Kestrel::Storage::StorageInfoImpl> host_;
};

/// The message of the GantryException that an operation ends with, "" when it succeeds. The exception must have been
/// noted as the last failure.
std::string messageOf(std::function<void()> const &operation);
void writeFile(std::string const &path, std::string const &text);
std::string readFile(std::string const &path);
bool exists(std::string const &path);
/// What stands below a directory, sorted, relative to it; links are not followed.
std::vector<std::string> treeOf(std::string const &path);
