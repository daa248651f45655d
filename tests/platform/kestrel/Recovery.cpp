// SPDX-License-Identifier: Apache-2.0
//
// What a killed process leaves: a record whose rename did not happen, at every place where it could have died.
#include "Fixture.h"

#include <chrono>
#include <filesystem>

#include <fcntl.h>
#include <sys/file.h>

#include "DirectoryLock.h"

namespace {

namespace fs = std::filesystem;
using Store::VolumeState;

class RecoveryTest : public KestrelTest {
protected:
    RecoveryTest() {
        uuid_ = createVolume(*gold_, "dir");
        gold_->MountConfigLumo("dir", "", "", false);
        writeFile(at("volumes/gold/dir/file"), "content");
        other_ = createVolume(*gold_, "other");
    }

    std::string mounted() const {
        return at("volumes/gold/dir");
    }
    std::string putAway() const {
        return at("lumos/" + uuid_);
    }
    void leave(VolumeState state) {
        Store::HostStore(root_, Store::HostStore::Mode::ReadWrite).putVolumes({{uuid_, containerId, "dir", state}}, {});
    }
    /// Any change of a config volume.
    void useHost() {
        gold_->MountConfigLumo("other", "", "", false);
        gold_->UnmountConfigLumo("other", "", "", false);
    }
    std::optional<Store::Volume> record() const {
        return stored().volume(uuid_);
    }

    FileSystemPointer gold_ = mountGold();
    std::string uuid_;
    std::string other_;
};

TEST_F(RecoveryTest, fault_56_AMountKilledBeforeItsRenameIsFinished) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Mounting);
    useHost();
    EXPECT_EQ(readFile(mounted() + "/file"), "content");
    EXPECT_FALSE(exists(putAway()));
    EXPECT_EQ(record()->state, VolumeState::Mounted);
}

TEST_F(RecoveryTest, fault_56_AnUnmountKilledBeforeItsRenameIsFinished) {
    leave(VolumeState::Unmounting);
    useHost();
    EXPECT_EQ(readFile(putAway() + "/file"), "content");
    EXPECT_FALSE(exists(mounted()));
    EXPECT_EQ(record()->state, VolumeState::Unmounted);
}

TEST_F(RecoveryTest, fault_56_ARemovalKilledBeforeItsRenameIsFinished) {
    leave(VolumeState::Removing);
    daemon_->removeVolume(uuid_);
    useHost();
    EXPECT_FALSE(exists(mounted()));
    EXPECT_FALSE(exists(putAway()));
    EXPECT_FALSE(record());
}

TEST_F(RecoveryTest, fault_56_ARemovalKilledInMidDeletionIsFinished) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Removing);
    useHost();
    EXPECT_FALSE(exists(putAway()));
    EXPECT_FALSE(record());
}

TEST_F(RecoveryTest, fault_56_ARemovalKilledAfterTheArraysDeletionCanBeRepeated) {
    daemon_->removeVolume(uuid_);
    gold_->RemoveConfigLumo("dir", "", "", false);
    EXPECT_FALSE(exists(mounted()));
    EXPECT_FALSE(exists(putAway()));
}

TEST_F(RecoveryTest, fault_56_ARemovalKilledInMidDeletionCanBeRepeatedOnce) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Removing);
    daemon_->removeVolume(uuid_);
    gold_->RemoveConfigLumo("dir", "", "", false);
    EXPECT_FALSE(exists(putAway()));
    EXPECT_NE(messageOf([&] { gold_->RemoveConfigLumo("dir", "", "", false); }), "");
    EXPECT_NE(messageOf([&] { gold_->RemoveConfigLumo("", uuid_, "", false); }), "");
}

TEST_F(RecoveryTest, fault_56_ARepeatedRemovalByNameTakesTheNewVolumeOfThatName) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Removing);
    daemon_->removeVolume(uuid_);
    std::string const second = createVolume(*gold_, "dir");
    gold_->RemoveConfigLumo("dir", "", "", false);
    EXPECT_FALSE(exists(putAway()));
    EXPECT_EQ(daemon_->volumes().count(second), 0U);
}

TEST_F(RecoveryTest, fault_56_ARemovalWhoseAnswerWasLostCanBeRepeated) {
    daemon_->hangUpAfterNext();
    EXPECT_NE(messageOf([&] { gold_->RemoveConfigLumo("dir", "", "", false); }), "");
    EXPECT_TRUE(exists(mounted()));
    gold_->RemoveConfigLumo("dir", "", "", false);
    EXPECT_FALSE(exists(mounted()));
    EXPECT_TRUE(stored().mounts().empty());
}

TEST_F(RecoveryTest, fault_56_AMountWhoseAnswerWasLostCanBeRepeated) {
    daemon_->hangUpAfterNext();
    EXPECT_NE(messageOf([&] { gold_->MountConfigLumo("other", "", "", false); }), "");
    EXPECT_FALSE(exists(at("volumes/gold/other")));
    gold_->MountConfigLumo("other", "", "", false);
    EXPECT_TRUE(exists(at("volumes/gold/other")));
}

TEST_F(RecoveryTest, fault_56_TheVolumeItselfCanBeUsedAtOnce) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Mounting);
    EXPECT_NE(messageOf([&] { gold_->MountConfigLumo("dir", "", "", false); }).find("is mounted already"),
              std::string::npos);
    EXPECT_EQ(readFile(mounted() + "/file"), "content");
    leave(VolumeState::Unmounting);
    EXPECT_NE(messageOf([&] { gold_->UnmountConfigLumo("dir", "", "", false); }).find("is mounted in"),
              std::string::npos);
    EXPECT_EQ(readFile(putAway() + "/file"), "content");
    leave(VolumeState::Unmounting);
    gold_->MountConfigLumo("dir", "", "", false);
    EXPECT_EQ(readFile(mounted() + "/file"), "content");
}

TEST_F(RecoveryTest, fault_56_TheContainersRemovalFinishesFirst) {
    leave(VolumeState::Unmounting);
    host_->RemoveLumoFileSystem(containerId);
    EXPECT_FALSE(exists(at("volumes/gold")));
    EXPECT_EQ(readFile(putAway() + "/file"), "content");
}

TEST_F(RecoveryTest, SomethingInTheWayOfOneVolumeDoesNotHoldUpTheOthers) {
    fs::rename(mounted(), putAway());
    leave(VolumeState::Mounting);
    fs::create_directory(mounted());
    writeFile(mounted() + "/mine", "mine");
    useHost();
    EXPECT_EQ(readFile(mounted() + "/mine"), "mine");
    EXPECT_EQ(readFile(putAway() + "/file"), "content");
    EXPECT_EQ(record()->state, VolumeState::Mounting);
    fs::remove_all(mounted());
    useHost();
    EXPECT_EQ(readFile(mounted() + "/file"), "content");
    EXPECT_EQ(record()->state, VolumeState::Mounted);
}

TEST_F(RecoveryTest, ACompletedMountIsSettledByTheNextOperation) {
    useHost();
    EXPECT_EQ(record()->state, VolumeState::Mounted);
}

TEST_F(RecoveryTest, fault_59_TheLockOfAnotherProcessIsWaitedForAndThenReported) {
    using namespace std::chrono_literals;
    Kestrel::Directory const lumos{Wire::UniqueFd(::open(at("lumos").c_str(), O_RDONLY | O_DIRECTORY)), at("lumos")};
    std::optional<Kestrel::DirectoryLock> first(std::in_place, lumos, 0ms);
    try {
        Kestrel::DirectoryLock(lumos, 20ms);
        FAIL() << "two hold the lock";
    } catch (Wire::Failure const &failure) {
        EXPECT_EQ(failure.code(), Wire::ErrorCode::FileBusy);
        EXPECT_EQ(failure.sentence(),
                  "the directory '" + at("lumos") + "' is busy: another process has held its lock for 20 ms");
    }
    first.reset();
    Kestrel::DirectoryLock(lumos, 0ms);
}

} // namespace
