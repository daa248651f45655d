// SPDX-License-Identifier: Apache-2.0
#include "wire/Paths.h"

#include <cstdlib>
#include <filesystem>

#include <sys/socket.h>

#include "wire/Failure.h"
#include "wire/SocketAddress.h"
#include "wire/UniqueFd.h"

#include <gtest/gtest.h>

namespace {

TEST(Paths, name_everything_below_the_root) {
    Wire::Paths const paths("/r");
    EXPECT_EQ(paths.root(), "/r");
    EXPECT_EQ(paths.hostStore(), "/r/host.db");
    EXPECT_EQ(paths.volumes(), "/r/volumes");
    EXPECT_EQ(paths.lumos(), "/r/lumos");
    EXPECT_EQ(paths.arrays(), "/r/arrays");
    EXPECT_EQ(paths.run(), "/r/run");
    EXPECT_EQ(paths.orderedSocket(), "/r/run/lumod.sock");
    EXPECT_EQ(paths.prioritySocket(), "/r/run/lumod-priority.sock");
    EXPECT_EQ(paths.lockFile(), "/r/run/lumod.lock");
    EXPECT_EQ(paths.pidFile(), "/r/run/lumod.pid");
    EXPECT_EQ(paths.logs(), "/r/log");
    EXPECT_EQ(paths.logFile(), "/r/log/lumod.log");
}

TEST(Paths, do_not_count_trailing_slashes) {
    EXPECT_EQ(Wire::Paths("/r//").hostStore(), "/r/host.db");
    EXPECT_EQ(Wire::Paths("/").hostStore(), "/host.db");
}

TEST(Paths, take_the_root_from_the_environment) {
    setenv("TOVI_ROOT", "/somewhere", 1);
    EXPECT_EQ(Wire::rootFromEnvironment(), "/somewhere");
    setenv("TOVI_ROOT", "", 1);
    EXPECT_EQ(Wire::rootFromEnvironment(), "/var/lib/tovi");
    unsetenv("TOVI_ROOT");
    EXPECT_EQ(Wire::rootFromEnvironment(), "/var/lib/tovi");
}

class Directory {
public:
    Directory()
        : path_(std::filesystem::temp_directory_path() / "tovi-wire-XXXXXX") {
        std::string name = path_.string();
        path_ = mkdtemp(name.data());
    }
    ~Directory() {
        std::filesystem::remove_all(path_);
    }
    std::filesystem::path path_;
};

TEST(SocketAddress, reaches_a_socket_whose_path_is_longer_than_the_kernel_takes) {
    Directory const directory;
    std::filesystem::path const deep = directory.path_ / std::string(100, 'd') / std::string(100, 'e');
    std::filesystem::create_directories(deep);
    std::string const path = (deep / "lumod.sock").string();

    Wire::UniqueFd const listener(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    Wire::SocketAddress const bound(path);
    ASSERT_EQ(bind(listener.get(), bound.get(), bound.size()), 0);
    ASSERT_EQ(listen(listener.get(), 1), 0);
    EXPECT_TRUE(std::filesystem::is_socket(path));

    Wire::UniqueFd const client(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    Wire::SocketAddress const reached(path);
    EXPECT_EQ(connect(client.get(), reached.get(), reached.size()), 0);
}

TEST(SocketAddress, tells_that_the_directory_of_a_long_path_is_missing) {
    try {
        Wire::SocketAddress const address("/" + std::string(120, 'x') + "/lumod.sock");
        FAIL() << "a missing directory was opened";
    } catch (Wire::Failure const &failure) {
        EXPECT_EQ(failure.code(), Wire::ErrorCode::FileMissing);
        EXPECT_EQ(failure.sentence(), "the directory of the socket /" + std::string(120, 'x') +
                                          "/lumod.sock cannot be opened: No such file or directory");
    }
}

TEST(SocketAddress, tells_that_the_directory_of_a_long_path_is_none) {
    try {
        Wire::SocketAddress const address("/dev/null/" + std::string(100, 'x'));
        FAIL() << "a device was opened as a directory";
    } catch (Wire::Failure const &failure) {
        EXPECT_EQ(failure.code(), Wire::ErrorCode::IoError);
        EXPECT_EQ(failure.sentence(), "the directory of the socket /dev/null/" + std::string(100, 'x') +
                                          " cannot be opened: Not a directory");
    }
}

TEST(SocketAddress, refuses_a_name_that_is_too_long_in_any_directory) {
    for (std::string const directory : {"/tmp/", "./", ""}) {
        std::string const path = directory + std::string(120, 'x');
        try {
            Wire::SocketAddress const address(path);
            FAIL() << "a name of 120 characters was accepted";
        } catch (Wire::Failure const &failure) {
            EXPECT_EQ(failure.code(), Wire::ErrorCode::InvalidArgument);
            EXPECT_EQ(failure.sentence(), "the name of the socket " + path + " is too long");
        }
    }
}

} // namespace
