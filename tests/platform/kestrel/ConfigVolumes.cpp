// SPDX-License-Identifier: Apache-2.0
//
// Creating, mounting, unmounting and removing config volumes.
#include "Fixture.h"

#include <filesystem>

namespace {

namespace fs = std::filesystem;

class ConfigVolumesTest : public KestrelTest {
protected:
    void mount(std::string const &name, std::string const &uuid = "") {
        gold_->MountConfigLumo(name, uuid, "", false);
    }
    void unmount(std::string const &name, std::string const &uuid = "") {
        gold_->UnmountConfigLumo(name, uuid, "", false);
    }
    void remove(std::string const &name, std::string const &uuid = "") {
        gold_->RemoveConfigLumo(name, uuid, "", false);
    }

    FileSystemPointer gold_ = mountGold();
};

TEST_F(ConfigVolumesTest, CreationTellsTheDaemonAndDoesNotMount) {
    std::string uuid = "before";
    gold_->CreateConfigLumo("dir", "policy text", 42, "vm", uuid, "", false);
    auto const volumes = daemon_->volumes();
    ASSERT_EQ(volumes.count(uuid), 1U);
    EXPECT_EQ(volumes.at(uuid).containerId, containerId);
    EXPECT_EQ(volumes.at(uuid).directoryName, "dir");
    EXPECT_EQ(volumes.at(uuid).policy, "policy text");
    EXPECT_EQ(volumes.at(uuid).sizeMb, 42);
    EXPECT_TRUE(treeOf(at("volumes/gold")).empty());
    EXPECT_TRUE(stored().mounts().empty());
}

TEST_F(ConfigVolumesTest, ARefusedNameIsShownInOneLine) {
    EXPECT_EQ(messageOf([&] { mount("a\nb\x7f"); }), "the directory name 'a\\x0ab\\x7f' has a control character in it");
}

TEST_F(ConfigVolumesTest, ANegativeSizeIsRefused) {
    std::string uuid;
    EXPECT_EQ(messageOf([&] { gold_->CreateConfigLumo("dir", "", -1, "", uuid, "", false); }),
              "the size of a config volume cannot be -1 MB: a positive number, or 0 for the default, is expected");
    EXPECT_TRUE(daemon_->volumes().empty());
}

TEST_F(ConfigVolumesTest, fault_53_NamesThatAreNoDirectoryNamesAreRefused) {
    using namespace std::string_literals;
    daemon_->takeRequests();
    for (std::string const &name : {""s, "."s, ".."s, "a/b"s, "a\nb"s, "a\0b"s, "a\xff"s, std::string(256, 'x')}) {
        EXPECT_NE(messageOf([&] { createVolume(*gold_, name); }).find("the directory name"), std::string::npos);
        EXPECT_NE(messageOf([&] { mount(name); }).find("the directory name"), std::string::npos);
        EXPECT_NE(messageOf([&] { unmount(name); }).find("the directory name"), std::string::npos);
        EXPECT_NE(messageOf([&] { remove(name); }).find("the directory name"), std::string::npos);
    }
    for (std::string const uuid : {"..", "../../x", "a/b"}) {
        EXPECT_NE(messageOf([&] { mount("", uuid); }).find("the volume uuid"), std::string::npos);
        EXPECT_NE(messageOf([&] { remove("", uuid); }).find("the volume uuid"), std::string::npos);
    }
    EXPECT_TRUE(daemon_->takeRequests().empty());
}

TEST_F(ConfigVolumesTest, fault_53_WhatAProviderCallsItsVolumesIsCheckedToo) {
    daemon_->addVolume("../../escape", containerId, "dir");
    EXPECT_NE(messageOf([&] { mount("dir"); }).find("the volume uuid '../../escape' has a '/' in it"),
              std::string::npos);
    daemon_->removeVolume("../../escape");
    daemon_->addVolume("plain", containerId, "..");
    EXPECT_NE(messageOf([&] { mount("", "plain"); }).find("the directory name '..' cannot name a directory"),
              std::string::npos);
    EXPECT_TRUE(treeOf(at("volumes/gold")).empty());
}

TEST_F(ConfigVolumesTest, fault_64_ANameCannotBreakTheLineOfAMessage) {
    std::string const message = messageOf([&] { mount("a/\ntovicli: b\tc"); });
    EXPECT_NE(message.find("a/\\ntovicli: b\\tc"), std::string::npos) << message;
    EXPECT_EQ(message.find_first_of("\n\t"), std::string::npos) << message;
}

TEST_F(ConfigVolumesTest, MountBindsAndMakesTheDirectoryAppear) {
    std::string const uuid = createVolume(*gold_, "dir");
    daemon_->takeRequests();
    mount("dir");
    EXPECT_TRUE(fs::is_directory(at("volumes/gold/dir")));
    EXPECT_EQ(stored().mounts(), (std::vector<Store::Mount>{{uuid, containerId, "dir"}}));
    EXPECT_EQ(daemon_->takeRequests(), std::vector<std::string>{"bind /dir"});
}

TEST_F(ConfigVolumesTest, AVolumeIsNamedByItsUuidInAnySpelling) {
    std::string uuid = createVolume(*gold_, "dir");
    mount("", '{' + uuid + '}');
    EXPECT_TRUE(fs::is_directory(at("volumes/gold/dir")));
    unmount("ignored", uuid);
    EXPECT_FALSE(exists(at("volumes/gold/dir")));
    remove("", uuid);
    EXPECT_TRUE(daemon_->volumes().empty());
}

TEST_F(ConfigVolumesTest, ThePriorityFlagTakesThePrioritySocket) {
    std::string uuid;
    daemon_->takeRequests();
    gold_->CreateConfigLumo("dir", "", 0, "", uuid, "", true);
    gold_->MountConfigLumo("dir", "", "", true);
    gold_->UnmountConfigLumo("dir", "", "", true);
    gold_->RemoveConfigLumo("dir", "", "", true);
    EXPECT_EQ(daemon_->takeRequests(),
              (std::vector<std::string>{"priority create dir", "priority bind /dir", "priority unbind " + uuid + "/",
                                        "priority delete /dir"}));
}

TEST_F(ConfigVolumesTest, ContentSurvivesUnmountMountAndRestart) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    fs::create_directories(at("volumes/gold/dir/sub"));
    writeFile(at("volumes/gold/dir/sub/vm.cfg"), "memory=4");
    unmount("dir");
    EXPECT_TRUE(treeOf(at("volumes/gold")).empty());
    EXPECT_EQ(readFile(at("lumos/" + uuid + "/sub/vm.cfg")), "memory=4");
    gold_.reset();
    host_.emplace();
    for (auto *raw : host_->GetLumoFileSystems()) {
        gold_.reset(raw);
    }
    mount("dir");
    EXPECT_EQ(readFile(at("volumes/gold/dir/sub/vm.cfg")), "memory=4");
    EXPECT_TRUE(treeOf(at("lumos")).empty());
}

TEST_F(ConfigVolumesTest, UnmountLeavesTheUnbindingToTheDaemon) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    daemon_->takeRequests();
    unmount("dir");
    EXPECT_EQ(daemon_->takeRequests(), std::vector<std::string>{"unbind " + uuid + "/"});
    EXPECT_TRUE(stored().mounts().empty());
}

TEST_F(ConfigVolumesTest, AMountedVolumeIsNotMountedTwice) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    daemon_->takeRequests();
    EXPECT_EQ(messageOf([&] { mount("dir"); }),
              "the config volume 'dir' (" + uuid + ") is mounted already in the storage container 'gold'");
    EXPECT_EQ(daemon_->takeRequests(), std::vector<std::string>{"bind /dir"}) << "stays bound";
}

TEST_F(ConfigVolumesTest, AVolumeWithoutADirectoryNameIsNotMounted) {
    std::string const uuid = "a1b20001-1111-4aaa-8aaa-000000000003";
    daemon_->addVolume(uuid, containerId, "");
    daemon_->takeRequests();
    EXPECT_EQ(messageOf([&] { mount("", uuid); }),
              "the virtual volume " + uuid + " is no config volume: it has no directory name");
    EXPECT_EQ(daemon_->takeRequests(), (std::vector<std::string>{"bind " + uuid + "/", "unbind " + uuid + "/"}));
}

TEST_F(ConfigVolumesTest, WhatIsNotMountedIsNotUnmounted) {
    std::string const uuid = createVolume(*gold_, "dir");
    daemon_->takeRequests();
    EXPECT_EQ(messageOf([&] { unmount("dir"); }),
              "no config volume named 'dir' is mounted in the storage container 'gold'");
    EXPECT_EQ(messageOf([&] { unmount("", uuid); }),
              "the config volume " + uuid + " is not mounted in the storage container 'gold'");
    EXPECT_TRUE(daemon_->takeRequests().empty());
    mount("dir");
    unmount("dir");
    EXPECT_NE(messageOf([&] { unmount("dir"); }), "");
}

TEST_F(ConfigVolumesTest, AVolumeOfAnotherContainerIsNotTouched) {
    std::string id = otherId;
    FileSystemPointer const silver(host_->AddLumoFileSystem("silver", id, {}, true));
    std::string const uuid = createVolume(*silver, "dir");
    silver->MountConfigLumo("dir", "", "", false);
    EXPECT_NE(messageOf([&] { mount("", uuid); }), "");
    EXPECT_NE(messageOf([&] { unmount("", uuid); }), "");
    EXPECT_NE(messageOf([&] { remove("", uuid); }), "");
    EXPECT_TRUE(exists(at("volumes/silver/dir")));
    EXPECT_EQ(daemon_->volumes().size(), 1U);
}

TEST_F(ConfigVolumesTest, AUsersDirectoryOfThatNameIsInTheWay) {
    std::string const uuid = createVolume(*gold_, "dir");
    fs::create_directory(at("volumes/gold/dir"));
    writeFile(at("volumes/gold/dir/mine"), "mine");
    daemon_->takeRequests();
    EXPECT_EQ(messageOf([&] { mount("dir"); }),
              "'" + at("volumes/gold/dir") + "' is in the way: it is no config volume's directory; move it elsewhere");
    EXPECT_EQ(readFile(at("volumes/gold/dir/mine")), "mine");
    EXPECT_TRUE(stored().mounts().empty());
    EXPECT_EQ(daemon_->takeRequests(), (std::vector<std::string>{"bind /dir", "unbind " + uuid + "/"}));
    fs::remove_all(at("volumes/gold/dir"));
    mount("dir");
}

TEST_F(ConfigVolumesTest, fault_54_ALinkInThePathIsNotFollowed) {
    createVolume(*gold_, "dir");
    fs::create_directory(directory_ + "/elsewhere");
    fs::remove(at("volumes/gold"));
    fs::create_directory_symlink(directory_ + "/elsewhere", at("volumes/gold"));
    EXPECT_EQ(messageOf([&] { mount("dir"); }),
              "the directory '" + at("volumes/gold") + "' cannot be opened: a symbolic link stands there");
    EXPECT_TRUE(treeOf(directory_ + "/elsewhere").empty());
    EXPECT_TRUE(stored().mounts().empty());
}

TEST_F(ConfigVolumesTest, fault_54_AMountedDirectoryThatWasReplacedIsLeftAlone) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    fs::rename(at("volumes/gold/dir"), at("volumes/gold/moved"));
    fs::create_directory_symlink("/tmp", at("volumes/gold/dir"));
    EXPECT_EQ(messageOf([&] { unmount("dir"); }), "'" + at("volumes/gold/dir") +
                                                      "' is no longer the directory that was mounted there; move it "
                                                      "elsewhere");
    EXPECT_EQ(stored().mounts().size(), 1U);
    EXPECT_EQ(daemon_->volumes().at(uuid).endpoint, "pe-1") << "bound again";
    fs::remove(at("volumes/gold/dir"));
    fs::rename(at("volumes/gold/moved"), at("volumes/gold/dir"));
    unmount("dir");
}

TEST_F(ConfigVolumesTest, RemoveOfAMountedVolumeTakesItsContent) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    fs::create_directories(at("volumes/gold/dir/a/b/c"));
    fs::create_directory(directory_ + "/elsewhere");
    writeFile(directory_ + "/elsewhere/kept", "kept");
    fs::create_directory_symlink(directory_ + "/elsewhere", at("volumes/gold/dir/a/link"));
    fs::permissions(at("volumes/gold/dir/a/b"), fs::perms::none);
    remove("dir");
    EXPECT_TRUE(daemon_->volumes().empty());
    EXPECT_TRUE(treeOf(at("volumes/gold")).empty());
    EXPECT_TRUE(treeOf(at("lumos")).empty());
    EXPECT_TRUE(stored().mounts().empty());
    EXPECT_EQ(readFile(directory_ + "/elsewhere/kept"), "kept");
    EXPECT_EQ(messageOf([&] { remove("", uuid); }), "no array has the volume " + uuid + "/");
    EXPECT_EQ(messageOf([&] { remove("dir"); }), "no array has the volume /dir");
}

TEST_F(ConfigVolumesTest, RemoveOfAnUnmountedVolumeTakesItsContentToo) {
    createVolume(*gold_, "dir");
    mount("dir");
    writeFile(at("volumes/gold/dir/file"), "x");
    unmount("dir");
    remove("dir");
    EXPECT_TRUE(treeOf(at("lumos")).empty());
    EXPECT_TRUE(daemon_->volumes().empty());
}

TEST_F(ConfigVolumesTest, RemoveOfAVolumeThatWasNeverMountedNeedsNoRecord) {
    createVolume(*gold_, "dir");
    remove("dir");
    EXPECT_TRUE(daemon_->volumes().empty());
    EXPECT_EQ(messageOf([&] { remove("dir"); }), "no array has the volume /dir");
}

TEST_F(ConfigVolumesTest, RemoveDeletesADeepTree) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    auto const before = fs::current_path();
    fs::current_path(at("volumes/gold/dir"));
    for (int depth = 0; depth < 1500; ++depth) {
        fs::create_directory("dddd");
        writeFile("file", "x");
        fs::current_path("dddd");
    }
    fs::current_path(before);
    remove("dir");
    EXPECT_FALSE(exists(at("volumes/gold/dir")));
    EXPECT_FALSE(exists(at("lumos/" + uuid)));
}

TEST_F(ConfigVolumesTest, ANameTakenByANewVolumeCanBeMounted) {
    std::string const first = createVolume(*gold_, "dir");
    mount("dir");
    writeFile(at("volumes/gold/dir/first"), "x");
    unmount("dir");
    daemon_->removeVolume(first); // elsewhere
    std::string const second = createVolume(*gold_, "dir");
    mount("dir");
    EXPECT_TRUE(treeOf(at("volumes/gold/dir")).empty());
    EXPECT_EQ(stored().mounts().at(0).volumeUuid, second);
    remove("dir");
    EXPECT_EQ(treeOf(at("lumos")), (std::vector<std::string>{first, first + "/first"}));
}

TEST_F(ConfigVolumesTest, ADirectoryThatSomebodyDeletedDoesNotHoldUpTheUnmount) {
    createVolume(*gold_, "dir");
    mount("dir");
    fs::remove_all(at("volumes/gold/dir"));
    unmount("dir");
    mount("dir");
    EXPECT_TRUE(fs::is_directory(at("volumes/gold/dir")));
}

TEST_F(ConfigVolumesTest, AVolumeDeletedElsewhereCanStillBeUnmountedAndRemoved) {
    std::string const uuid = createVolume(*gold_, "dir");
    mount("dir");
    writeFile(at("volumes/gold/dir/file"), "x");
    daemon_->removeVolume(uuid);
    unmount("dir");
    EXPECT_FALSE(exists(at("volumes/gold/dir")));
    remove("dir");
    EXPECT_TRUE(treeOf(at("lumos")).empty());
}

TEST_F(ConfigVolumesTest, WhenTheDaemonRefusesNothingChanges) {
    createVolume(*gold_, "dir");
    daemon_->failNext(Wire::ErrorCode::NoAccessibleEndpoint, "no endpoint of the array is accessible");
    EXPECT_EQ(messageOf([&] { mount("dir"); }), "no endpoint of the array is accessible");
    EXPECT_TRUE(treeOf(at("volumes/gold")).empty());
    mount("dir");
    daemon_->failNext(Wire::ErrorCode::FaultTimeout, "injected: TIMEOUT");
    EXPECT_EQ(messageOf([&] { unmount("dir"); }), "injected: TIMEOUT");
    EXPECT_TRUE(exists(at("volumes/gold/dir")));
    daemon_->failNext(Wire::ErrorCode::ProviderOffline, "the provider is offline");
    EXPECT_EQ(messageOf([&] { remove("dir"); }), "the provider is offline");
    EXPECT_EQ(stored().mounts().size(), 1U);
    EXPECT_TRUE(exists(at("volumes/gold/dir")));
    remove("dir");
}

TEST_F(ConfigVolumesTest, WithTheDaemonGoneNothingChangesAndTheSocketIsNamed) {
    createVolume(*gold_, "dir");
    mount("dir");
    daemon_.reset();
    for (auto const &message : {messageOf([&] { createVolume(*gold_, "x"); }), messageOf([&] { mount("x"); }),
                                messageOf([&] { unmount("dir"); }), messageOf([&] { remove("dir"); })}) {
        EXPECT_NE(message.find(at("run/lumod.sock")), std::string::npos) << message;
    }
    EXPECT_TRUE(exists(at("volumes/gold/dir")));
    EXPECT_EQ(stored().mounts().size(), 1U);
}

TEST_F(ConfigVolumesTest, TheReservedOperationSaysThatThereIsNone) {
    EXPECT_EQ(messageOf([&] { gold_->ReservedConfigLumo("a", "b", "", false); }),
              "this host has no such operation on config volumes");
}

TEST_F(ConfigVolumesTest, MountingAndUnmountingLeaveNoDescriptors) {
    auto const descriptors = [] {
        return std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator());
    };
    createVolume(*gold_, "dir");
    mount("dir");
    unmount("dir");
    auto const before = descriptors();
    for (int i = 0; i < 10; ++i) {
        mount("dir");
        EXPECT_NE(messageOf([&] { mount("dir"); }), "");
        unmount("dir");
        EXPECT_NE(messageOf([&] { unmount("dir"); }), "");
    }
    EXPECT_EQ(descriptors(), before);
}

} // namespace
