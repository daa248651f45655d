// SPDX-License-Identifier: Apache-2.0
//
// Another's files, locks and damage, as the store's callers see them.
#include "Fixture.h"

#include <filesystem>
#include <fstream>
#include <iostream>

#include <sys/wait.h>
#include <unistd.h>

#include "sqlite/Database.h"
#include "sqlite/Transaction.h"

namespace {

using Store::HostStore;
using namespace std::chrono_literals;

class FaultsTest : public StoreTest {
protected:
    void expectRefused(Wire::ErrorCode expected) {
        std::string const before = bytesOf(file());
        HostStore store(root_, HostStore::Mode::ReadWrite);
        HostStore reader(root_, HostStore::Mode::QueryOnly);
        for (auto const &failure :
             {failureOf([&] { store.providers(); }), failureOf([&] { store.setOrkaContext("x"); }),
              failureOf([&] { store.removeProvider("x"); }), failureOf([&] { reader.providers(); })}) {
            ASSERT_TRUE(failure);
            EXPECT_EQ(failure->code(), expected) << failure->sentence();
            EXPECT_NE(failure->sentence().find("the host store '" + file() + "'"), std::string::npos);
        }
        EXPECT_EQ(bytesOf(file()), before);
    }
};

/// Does the work of a forked child and ends it, before an exception could reach the fixture and remove what others use.
template <typename Work>
[[noreturn]] void inChild(Work work) {
    int status = 0;
    try {
        work();
    } catch (std::exception const &failure) {
        std::cerr << "child " << ::getpid() << ": " << failure.what() << '\n';
        status = 1;
    }
    ::_exit(status);
}

TEST_F(FaultsTest, fault_51_RefusesANewerStore) {
    HostStore(root_, HostStore::Mode::ReadWrite).setOrkaContext("x");
    plainSql("PRAGMA user_version=2");
    expectRefused(Wire::ErrorCode::FileNewer);
}

TEST_F(FaultsTest, fault_51_RefusesTheFileOfAnotherProgram) {
    std::filesystem::create_directories(root_);
    plainSql("PRAGMA application_id=1; CREATE TABLE t (a)");
    expectRefused(Wire::ErrorCode::FileForeign);
}

TEST_F(FaultsTest, fault_54_FollowsNoLinkToAFileElsewhere) {
    std::string const elsewhere = root_ + "-elsewhere";
    HostStore(elsewhere, HostStore::Mode::ReadWrite).setOrkaContext("x");
    std::filesystem::create_directories(root_);
    std::filesystem::create_symlink(elsewhere + "/host.db", file());
    expectRefused(Wire::ErrorCode::IoError);
    std::filesystem::remove(file());
    std::filesystem::create_symlink(elsewhere + "/new.db", file());
    HostStore store(root_, HostStore::Mode::ReadWrite);
    ASSERT_TRUE(failureOf([&] { store.setOrkaContext("y"); }));
    EXPECT_FALSE(std::filesystem::exists(elsewhere + "/new.db"));
}

TEST_F(FaultsTest, fault_48_RefusesADamagedStore) {
    std::filesystem::create_directories(root_);
    std::ofstream(file()) << "not a database at all";
    expectRefused(Wire::ErrorCode::FileMalformed);
}

TEST_F(FaultsTest, fault_48_RefusesAVolumeInNoState) {
    HostStore store(root_, HostStore::Mode::ReadWrite);
    store.addFileSystem({"gold", "c", {}});
    store.putVolumes({{"v", "c", "d", Store::VolumeState::Mounted}}, {});
    for (std::string const state : {"7", "-1"}) {
        plainSql("PRAGMA ignore_check_constraints=1; UPDATE volume SET state = " + state);
        for (auto const &failure : {failureOf([&] { store.volumes(); }), failureOf([&] { store.volume("v"); })}) {
            ASSERT_TRUE(failure);
            EXPECT_EQ(failure->code(), Wire::ErrorCode::FileMalformed);
            EXPECT_EQ(failure->sentence(),
                      "the host store '" + file() + "' is damaged: it knows no state " + state + " of config volumes");
        }
    }
}

TEST_F(FaultsTest, fault_49_BusyAfterTheTimeoutAndNothingChanged) {
    HostStore store(root_, HostStore::Mode::ReadWrite, 30ms);
    store.setOrkaContext("kept");
    Sqlite::Database holder(file(), {0x54764873, 1, "", "the host store"}, Sqlite::Mode::ReadWrite);
    {
        Sqlite::Transaction const held(holder);
        auto const failure = failureOf([&] { store.setOrkaContext("lost"); });
        ASSERT_TRUE(failure);
        EXPECT_EQ(failure->code(), Wire::ErrorCode::FileBusy);
        EXPECT_NE(failure->sentence().find("' is busy: another process has held its lock for 30 ms"), std::string::npos)
            << failure->sentence();
        EXPECT_EQ(store.orkaContext(), "kept");
    }
    store.setOrkaContext("now");
    EXPECT_EQ(store.orkaContext(), "now");
}

TEST_F(FaultsTest, fault_49_AReaderOnAnEventLoopNeverWaits) {
    HostStore(root_, HostStore::Mode::ReadWrite).setOrkaContext("kept");
    HostStore reader(root_, HostStore::Mode::QueryOnly, 0ms);
    Sqlite::Database holder(file(), {0x54764873, 1, "", "the host store"}, Sqlite::Mode::ReadWrite);
    ASSERT_EQ(reader.orkaContext(), "kept");
    holder.execute("BEGIN EXCLUSIVE");
    EXPECT_EQ(failureOf([&] { reader.orkaContext(); })->code(), Wire::ErrorCode::FileBusy);
    holder.execute("ROLLBACK");
    EXPECT_EQ(reader.orkaContext(), "kept");
}

TEST_F(FaultsTest, TwoWritersLoseNothing) {
    constexpr int rounds = 25;
    { HostStore(root_, HostStore::Mode::ReadWrite).setOrkaContext("x"); }
    std::vector<pid_t> children;
    for (int writer = 0; writer < 2; ++writer) {
        pid_t const child = ::fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            inChild([&] {
                HostStore store(root_, HostStore::Mode::ReadWrite);
                for (int i = 0; i < rounds; ++i) {
                    std::string const name = std::to_string(writer) + '-' + std::to_string(i);
                    store.addFileSystem({name, "id-" + name, {}});
                }
            });
        }
        children.push_back(child);
    }
    for (pid_t const child : children) {
        int status = -1;
        ::waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
    EXPECT_EQ(HostStore(root_, HostStore::Mode::QueryOnly).fileSystems().size(), 2U * rounds);
}

TEST_F(FaultsTest, TwoMakersOfOneStoreBothSucceed) {
    std::vector<pid_t> children;
    for (int writer = 0; writer < 4; ++writer) {
        pid_t const child = ::fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            inChild([&] {
                HostStore(root_, HostStore::Mode::ReadWrite).setEndpointOutage("pe-" + std::to_string(writer), true);
            });
        }
        children.push_back(child);
    }
    for (pid_t const child : children) {
        int status = -1;
        ::waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
    EXPECT_EQ(HostStore(root_, HostStore::Mode::QueryOnly).endpointOutages().size(), 4U);
}

TEST_F(FaultsTest, ARootThatCannotBeMadeIsNamed) {
    std::ofstream(directory_ + "/some") << "a file where a directory belongs";
    auto const failure = failureOf([&] { HostStore(root_, HostStore::Mode::ReadWrite).setOrkaContext("x"); });
    ASSERT_TRUE(failure);
    EXPECT_NE(failure->sentence().find(directory_ + "/some"), std::string::npos) << failure->sentence();
    EXPECT_NE(failure->sentence().find("Not a directory"), std::string::npos) << failure->sentence();
}

} // namespace
