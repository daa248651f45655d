// SPDX-License-Identifier: Apache-2.0
//
// Mounting containers: the store's record, the directory, and what is refused.
#include "Fixture.h"

#include <filesystem>

namespace {

class ContainersTest : public KestrelTest {
protected:
    std::string addMessage(std::string const &name, std::string id, std::vector<std::string> const &arrays = {}) {
        return messageOf([&] { FileSystemPointer(host_->AddLumoFileSystem(name, id, arrays, true)); });
    }
};

TEST_F(ContainersTest, MakingTheInterfaceTouchesNothing) {
    daemon_.reset();
    std::filesystem::remove_all(root_);
    { Kestrel::Storage::StorageInfoImpl const another; }
    EXPECT_TRUE(namesOfFileSystems().empty());
    EXPECT_EQ(host_->GetLumoFileSystemByPath(at("volumes/gold")), nullptr);
    EXPECT_FALSE(exists(root_));
}

TEST_F(ContainersTest, AddMakesTheDirectoryAndTheRecord) {
    std::string id = "{AAAAAAAA111122223333444444444444}";
    FileSystemPointer const gold(host_->AddLumoFileSystem("gold", id, {"array-1"}, true));
    EXPECT_EQ(id, containerId);
    EXPECT_EQ(gold->GetName(), "gold");
    EXPECT_EQ(gold->GetId(), containerId);
    EXPECT_EQ(gold->GetContainerId(), containerId);
    EXPECT_TRUE(std::filesystem::is_directory(at("volumes/gold")));
    EXPECT_EQ(stored().fileSystems(),
              (std::vector<Store::FileSystem>{{"gold", containerId, std::vector<std::string>{"array-1"}}}));
}

TEST_F(ContainersTest, AddAsksTheDaemonOnce) {
    mountGold();
    EXPECT_EQ(daemon_->takeRequests(), std::vector<std::string>{"find " + containerId});
}

TEST_F(ContainersTest, TheVolumeNameNeedNotBeTheContainersName) {
    EXPECT_EQ(addMessage("elsewhere", containerId), "");
    EXPECT_TRUE(exists(at("volumes/elsewhere")));
}

TEST_F(ContainersTest, FileSystemsComeInTheOrderOfAddition) {
    EXPECT_EQ(addMessage("z", containerId), "");
    EXPECT_EQ(addMessage("a", otherId), "");
    EXPECT_EQ(namesOfFileSystems(), (std::vector<std::string>{"z", "a"}));
}

TEST_F(ContainersTest, AnIdMatchesInAnySpelling) {
    auto const gold = mountGold();
    EXPECT_TRUE(gold->HasContainerId(containerId));
    EXPECT_TRUE(gold->HasContainerId("AAAAAAAA-1111-2222-3333-444444444444"));
    EXPECT_TRUE(gold->HasContainerId("{aaaaaaaa111122223333444444444444}"));
    EXPECT_FALSE(gold->HasContainerId(otherId));
    EXPECT_FALSE(gold->HasContainerId(""));
    EXPECT_FALSE(gold->HasContainerId("gold"));
}

TEST_F(ContainersTest, ABadIdIsRefusedAndLeftAsItIs) {
    std::string id = "not an id";
    EXPECT_EQ(messageOf([&] { host_->AddLumoFileSystem("gold", id, {}, true); }),
              "'not an id' is no storage container id: a UUID of 32 hexadecimal digits is expected");
    EXPECT_EQ(id, "not an id");
    EXPECT_TRUE(daemon_->takeRequests().empty());
}

TEST_F(ContainersTest, fault_53_NamesThatAreNoDirectoryNamesAreRefused) {
    using namespace std::string_literals;
    for (std::string const &name : {""s, "."s, ".."s, "a/b"s, "/a"s, "../a"s, "a\nb"s, "a\0b"s, "a\x1b[31m"s, "\x7f"s,
                                    "a\xc2\x85"s, "a\xff"s, "\xc0\xaf"s, ".hidden"s, std::string(256, 'x')}) {
        EXPECT_NE(addMessage(name, containerId).find("the storage container name "), std::string::npos) << name;
    }
    EXPECT_EQ(addMessage("a/b", containerId),
              "the storage container name 'a/b' has a '/' in it: it must be a single directory name, not a path");
    EXPECT_TRUE(treeOf(at("volumes")).empty());
    EXPECT_TRUE(daemon_->takeRequests().empty());
}

TEST_F(ContainersTest, fault_55_LookAlikeNamesAreDistinct) {
    EXPECT_EQ(addMessage("a", containerId), "");
    EXPECT_EQ(addMessage("\xd0\xb0", otherId), "");
    EXPECT_EQ(treeOf(at("volumes")).size(), 2U);
}

TEST_F(ContainersTest, TheLongestAndTheStrangestNamesWork) {
    EXPECT_EQ(addMessage(std::string(255, 'x'), containerId), "");
    EXPECT_EQ(addMessage("-rf ~ '\"$(x)\" \xe2\x80\xae", otherId), "");
    EXPECT_EQ(namesOfFileSystems().size(), 2U);
}

TEST_F(ContainersTest, TheDaemonsRefusalsAreTheMessages) {
    EXPECT_EQ(addMessage("gold", "cccccccc-1111-2222-3333-444444444444"),
              "no provider exports the container cccccccc-1111-2222-3333-444444444444");
    EXPECT_EQ(addMessage("gold", containerId, {"no-such-array"}), "no provider serves the array no-such-array");
    EXPECT_FALSE(exists(at("host.db")));
    EXPECT_FALSE(exists(at("volumes")));
}

TEST_F(ContainersTest, AMountedContainerAndATakenNameAreRefusedSayingWhich) {
    mountGold();
    EXPECT_EQ(addMessage("other", containerId),
              "the storage container " + containerId + " is mounted already, as 'gold'");
    EXPECT_EQ(addMessage("gold", otherId),
              "the name 'gold' is taken: the storage container " + containerId + " is mounted under it");
    EXPECT_EQ(treeOf(at("volumes")), std::vector<std::string>{"gold"});
}

TEST_F(ContainersTest, fault_56_AStrayDirectoryIsTakenOver) {
    std::filesystem::create_directories(at("volumes/gold"));
    EXPECT_EQ(addMessage("gold", containerId), "");
}

TEST_F(ContainersTest, AFileOrALinkInTheWayIsRefused) {
    std::filesystem::create_directories(at("volumes"));
    writeFile(at("volumes/gold"), "a file");
    EXPECT_EQ(addMessage("gold", containerId),
              "'" + at("volumes/gold") + "' is in the way: it is no directory; move it elsewhere");
    std::filesystem::remove(at("volumes/gold"));
    std::filesystem::create_directory_symlink("/tmp", at("volumes/gold"));
    EXPECT_NE(addMessage("gold", containerId), "");
    EXPECT_TRUE(namesOfFileSystems().empty());
}

TEST_F(ContainersTest, fault_54_VolumesBehindALinkAreRefused) {
    std::filesystem::create_directory(directory_ + "/elsewhere");
    std::filesystem::create_directory_symlink(directory_ + "/elsewhere", at("volumes"));
    EXPECT_EQ(addMessage("gold", containerId),
              "the directory '" + at("volumes") + "' cannot be opened: a symbolic link stands there");
    EXPECT_TRUE(treeOf(directory_ + "/elsewhere").empty());
}

TEST_F(ContainersTest, IsFoundByThePathOfItsDirectoryOrOneInIt) {
    mountGold();
    auto const before = std::filesystem::current_path();
    std::filesystem::current_path(at("volumes/gold"));
    std::filesystem::create_directory_symlink(root_, directory_ + "/link");
    for (std::string const &path :
         {at("volumes/gold"), at("volumes/gold/"), at("volumes/gold//"), at("volumes/gold/a/b"), at("volumes/./gold/."),
          at("volumes/x/../gold"), std::string("."), std::string("sub"), std::string("../gold"),
          directory_ + "/link/volumes/gold", directory_ + "/link/volumes/gold/deep"}) {
        FileSystemPointer const found(host_->GetLumoFileSystemByPath(path));
        ASSERT_TRUE(found) << path;
        EXPECT_EQ(found->GetContainerId(), containerId);
    }
    std::filesystem::current_path(root_);
    for (std::string const &path : {std::string(), std::string("/"), std::string("gold"), root_, at("volumes"),
                                    at("volumes/"), at("volumes/golden"), at("volumes/gold/.."), at("lumos/gold"),
                                    std::string(".."), std::string("\0", 1), std::string(5000, 'x')}) {
        FileSystemPointer const found(host_->GetLumoFileSystemByPath(path));
        EXPECT_FALSE(found) << path;
    }
    std::filesystem::current_path(before);
}

TEST_F(ContainersTest, RemoveTakesTheRecordAndTheEmptyDirectory) {
    mountGold();
    host_->RemoveLumoFileSystem("{AAAAAAAA-1111-2222-3333-444444444444}");
    EXPECT_TRUE(namesOfFileSystems().empty());
    EXPECT_FALSE(exists(at("volumes/gold")));
    EXPECT_EQ(messageOf([&] { host_->RemoveLumoFileSystem(containerId); }),
              "the storage container " + containerId + " is not mounted on this host");
}

TEST_F(ContainersTest, RemoveOfABadIdIsRefused) {
    EXPECT_NE(messageOf([&] { host_->RemoveLumoFileSystem("gold"); }), "");
}

TEST_F(ContainersTest, RemoveIsRefusedWhileUsersFilesAreThere) {
    mountGold();
    writeFile(at("volumes/gold/notes"), "mine");
    EXPECT_EQ(messageOf([&] { host_->RemoveLumoFileSystem(containerId); }),
              "the storage container 'gold' is in use: its directory '" + at("volumes/gold") +
                  "' is not empty, there is 'notes' in it");
    EXPECT_EQ(readFile(at("volumes/gold/notes")), "mine");
    EXPECT_EQ(namesOfFileSystems(), std::vector<std::string>{"gold"});
}

TEST_F(ContainersTest, RemoveIsRefusedWhileConfigVolumesAreMounted) {
    auto const gold = mountGold();
    for (std::string const name : {"b", "a"}) {
        createVolume(*gold, name);
        gold->MountConfigLumo(name, "", "", false);
    }
    EXPECT_EQ(messageOf([&] { host_->RemoveLumoFileSystem(containerId); }),
              "the storage container 'gold' is in use: 2 config volumes are mounted in it, the first is 'b'");
    EXPECT_EQ(treeOf(at("volumes")), (std::vector<std::string>{"gold", "gold/a", "gold/b"}));
}

TEST_F(ContainersTest, fault_56_ARecordWhoseDirectoryIsMissingCanBeUsedAndRemoved) {
    auto const gold = mountGold();
    std::filesystem::remove(at("volumes/gold"));
    createVolume(*gold, "dir");
    gold->MountConfigLumo("dir", "", "", false);
    EXPECT_TRUE(exists(at("volumes/gold/dir")));
    gold->UnmountConfigLumo("dir", "", "", false);
    std::filesystem::remove(at("volumes/gold"));
    host_->RemoveLumoFileSystem(containerId);
    EXPECT_TRUE(namesOfFileSystems().empty());
}

TEST_F(ContainersTest, WithTheDaemonGoneWhatNeedsItFailsAndTheRestWorks) {
    auto const gold = mountGold();
    daemon_.reset();
    EXPECT_NE(addMessage("silver", otherId).find(at("run/lumod.sock")), std::string::npos);
    EXPECT_EQ(gold->CheckLumoAccessibility({"x", "y"}),
              std::vector<Gantry::Storage::LumoAccessibilityType>(2, Gantry::Storage::Unconfirmed));
    EXPECT_EQ(namesOfFileSystems(), std::vector<std::string>{"gold"});
    host_->RemoveLumoFileSystem(containerId);
    EXPECT_TRUE(namesOfFileSystems().empty());
}

TEST_F(ContainersTest, AFileSystemOutlivesTheInterfaceThatHandedItOut) {
    auto const gold = mountGold();
    host_.reset();
    EXPECT_NE(createVolume(*gold, "dir"), "");
}

TEST_F(ContainersTest, AccessibilityComesInTheOrderOfTheIds) {
    auto const gold = mountGold();
    std::string const bound = createVolume(*gold, "bound");
    std::string const loose = createVolume(*gold, "loose");
    gold->MountConfigLumo("bound", "", "", false);
    daemon_->takeRequests();
    EXPECT_EQ(gold->CheckLumoAccessibility({loose, "unknown", bound, bound}),
              (std::vector<Gantry::Storage::LumoAccessibilityType>{
                  Gantry::Storage::Inaccessible, Gantry::Storage::NonExistent, Gantry::Storage::Accessible,
                  Gantry::Storage::Accessible}));
    EXPECT_TRUE(gold->CheckLumoAccessibility({}).empty());
    EXPECT_EQ(daemon_->takeRequests(), std::vector<std::string>{"check 4"});
}

} // namespace
