// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

namespace {

using Store::FileSystem;
using Store::HostStore;
using Store::VolumeState;

class FileSystemsTest : public StoreTest {
protected:
    HostStore store_{root_, HostStore::Mode::ReadWrite};
};

FileSystem const zulu{"zulu", "id-1", {"array-b", "array-a"}};
FileSystem const alpha{"alpha", "id-2", {}};

TEST_F(FileSystemsTest, AnAbsentStoreHasNoneAndStaysAbsent) {
    EXPECT_TRUE(store_.fileSystems().empty());
    EXPECT_FALSE(store_.fileSystem("id-1"));
    EXPECT_FALSE(store_.fileSystemNamed("zulu"));
    EXPECT_FALSE(store_.removeFileSystem("id-1"));
    store_.requireNoMounts("id-1");
    store_.visitFileSystems([](std::string_view, std::string_view) { FAIL(); });
    EXPECT_FALSE(exists(root_));
}

TEST_F(FileSystemsTest, ComeInTheOrderOfAddition) {
    store_.addFileSystem(zulu);
    store_.addFileSystem(alpha);
    EXPECT_EQ(store_.fileSystems(), (std::vector<FileSystem>{zulu, alpha}));
    std::string visited;
    store_.visitFileSystems(
        [&](std::string_view name, std::string_view id) { visited.append(name).append("=").append(id).append(" "); });
    EXPECT_EQ(visited, "zulu=id-1 alpha=id-2 ");
}

TEST_F(FileSystemsTest, AreFoundByIdAndByName) {
    store_.addFileSystem(zulu);
    EXPECT_EQ(store_.fileSystem("id-1"), zulu);
    EXPECT_EQ(store_.fileSystemNamed("zulu"), zulu);
    EXPECT_FALSE(store_.fileSystemNamed("Zulu"));
    EXPECT_FALSE(store_.fileSystem("zulu"));
}

TEST_F(FileSystemsTest, ATakenNameOrContainerIsRefusedSayingWhich) {
    store_.addFileSystem(zulu);
    auto const sameContainer = failureOf([&] { store_.addFileSystem({"other", "id-1", {}}); });
    ASSERT_TRUE(sameContainer);
    EXPECT_EQ(sameContainer->code(), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(sameContainer->sentence(), "the storage container id-1 is mounted already, as 'zulu'");
    auto const sameName = failureOf([&] { store_.addFileSystem({"zulu", "id-3", {}}); });
    ASSERT_TRUE(sameName);
    EXPECT_EQ(sameName->sentence(), "the name 'zulu' is taken: the storage container id-1 is mounted under it");
    EXPECT_EQ(store_.fileSystems().size(), 1U);
}

TEST_F(FileSystemsTest, ManyAreReadInOrder) {
    for (int i = 0; i < 50; ++i) {
        store_.addFileSystem({"c" + std::to_string(i), "id" + std::to_string(i), {"a", "b"}});
    }
    auto const all = store_.fileSystems();
    ASSERT_EQ(all.size(), 50U);
    EXPECT_EQ(all[49], (FileSystem{"c49", "id49", {"a", "b"}}));
}

TEST_F(FileSystemsTest, RemovalIsRefusedWhileAConfigVolumeIsMounted) {
    store_.addFileSystem(zulu);
    store_.putVolumes({{"v1", "id-1", "one", VolumeState::Mounting}}, {});
    auto const one = failureOf([&] { store_.removeFileSystem("id-1"); });
    ASSERT_TRUE(one);
    EXPECT_EQ(one->code(), Wire::ErrorCode::InUse);
    EXPECT_EQ(one->sentence(), "the storage container 'zulu' is in use: the config volume 'one' is mounted in it");
    store_.putVolumes({{"v0", "id-1", "two", VolumeState::Mounted}}, {});
    EXPECT_EQ(failureOf([&] { store_.requireNoMounts("id-1"); })->sentence(),
              "the storage container 'zulu' is in use: 2 config volumes are mounted in it, the first is 'one'");
    EXPECT_EQ(store_.mounts().size(), 2U);
}

TEST_F(FileSystemsTest, RemovalForgetsTheVolumesThatArePutAway) {
    store_.addFileSystem(zulu);
    store_.putVolumes({{"v1", "id-1", "one", VolumeState::Unmounted}}, {});
    EXPECT_TRUE(store_.removeFileSystem("id-1"));
    EXPECT_FALSE(store_.removeFileSystem("id-1"));
    EXPECT_FALSE(store_.volume("v1"));
    store_.addFileSystem({"zulu", "id-1", {}});
    EXPECT_TRUE(store_.fileSystem("id-1")->arrayIds.empty());
}

} // namespace
