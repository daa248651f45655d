// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

namespace {

using Store::HostStore;
using Store::Mount;
using Store::Volume;
using Store::VolumeState;

class VolumesTest : public StoreTest {
protected:
    VolumesTest() {
        store_.addFileSystem({"c", "id-1", {}});
        store_.addFileSystem({"d", "id-2", {}});
    }

    static Volume volume(std::string const &uuid, std::string const &name, VolumeState state) {
        return {uuid, "id-1", name, state};
    }

    HostStore store_{root_, HostStore::Mode::ReadWrite};
};

TEST_F(VolumesTest, AnAbsentStoreHasNone) {
    HostStore absent(directory_, HostStore::Mode::ReadWrite);
    EXPECT_TRUE(absent.mounts().empty());
    EXPECT_FALSE(absent.volume("v1"));
    EXPECT_FALSE(absent.mountedVolume("id-1", "one"));
    EXPECT_TRUE(absent.unmountedVolumes("id-1", "one").empty());
    EXPECT_TRUE(absent.unsettledVolumes().empty());
    EXPECT_TRUE(absent.volumes().empty());
    absent.checkIntegrity();
    absent.putVolumes({}, {});
    EXPECT_FALSE(exists(absent.path()));
}

TEST_F(VolumesTest, AMountedOneIsFoundByUuidAndByName) {
    Volume const one = volume("v1", "one", VolumeState::Mounting);
    store_.putVolumes({one}, {});
    EXPECT_EQ(store_.volume("v1"), one);
    EXPECT_EQ(store_.mountedVolume("id-1", "one"), one);
    EXPECT_FALSE(store_.mountedVolume("id-2", "one"));
    EXPECT_EQ(store_.mounts(), (std::vector<Mount>{{"v1", "id-1", "one"}}));
    EXPECT_TRUE(store_.unmountedVolumes("id-1", "one").empty());
}

TEST_F(VolumesTest, AnUnmountedOneIsNoMountAndRemembersItsName) {
    store_.putVolumes({volume("v1", "one", VolumeState::Mounted)}, {});
    store_.putVolumes({volume("v1", "one", VolumeState::Unmounting)}, {});
    EXPECT_TRUE(store_.mounts().empty());
    EXPECT_FALSE(store_.mountedVolume("id-1", "one"));
    EXPECT_EQ(store_.unmountedVolumes("id-1", "one").size(), 1U);
    EXPECT_EQ(store_.unsettledVolumes().size(), 1U);
}

TEST_F(VolumesTest, WhatIsSettledAlreadyIsLeftAsItIs) {
    Volume const mounted = volume("v1", "one", VolumeState::Mounted);
    Volume const unmounted = volume("v2", "two", VolumeState::Unmounted);
    store_.putVolumes({mounted, unmounted}, {});
    store_.putVolumes({}, {mounted, unmounted});
    EXPECT_EQ(store_.volumes(), (std::vector<Volume>{mounted, unmounted}));
    store_.checkIntegrity();
}

TEST_F(VolumesTest, SettlingGoesWithTheNextWrite) {
    Volume const mounting = volume("v1", "one", VolumeState::Mounting);
    Volume const unmounting = volume("v2", "two", VolumeState::Unmounting);
    Volume const removing = volume("v3", "three", VolumeState::Removing);
    store_.putVolumes({mounting, unmounting, removing}, {});
    EXPECT_EQ(store_.unsettledVolumes(),
              (std::vector<Store::UnsettledVolume>{{mounting, "c"}, {unmounting, "c"}, {removing, "c"}}));
    store_.putVolumes({volume("v4", "four", VolumeState::Mounting)}, {mounting, unmounting, removing});
    EXPECT_EQ(store_.volume("v1")->state, VolumeState::Mounted);
    EXPECT_EQ(store_.volume("v2")->state, VolumeState::Unmounted);
    EXPECT_FALSE(store_.volume("v3"));
    EXPECT_EQ(store_.unsettledVolumes().size(), 1U);
}

TEST_F(VolumesTest, SettlingLeavesARecordAloneThatHasGoneOn) {
    Volume const seen = volume("v1", "one", VolumeState::Removing);
    store_.putVolumes({seen}, {});
    store_.putVolumes({volume("v1", "one", VolumeState::Mounting)}, {});
    store_.putVolumes({}, {seen});
    EXPECT_EQ(store_.volume("v1")->state, VolumeState::Mounting);
}

TEST_F(VolumesTest, ADirectoryNameIsMountedOnceAContainer) {
    store_.putVolumes({volume("v1", "one", VolumeState::Mounted)}, {});
    auto const failure = failureOf([&] { store_.putVolumes({volume("v2", "one", VolumeState::Mounting)}, {}); });
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->code(), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(failure->sentence(), "the directory name 'one' is taken: the config volume v1 is mounted under it");
    store_.putVolumes({{"v3", "id-2", "one", VolumeState::Mounting}}, {});
    store_.putVolumes({volume("v1", "one", VolumeState::Unmounted)}, {});
    store_.putVolumes({volume("v2", "one", VolumeState::Mounting)}, {});
    EXPECT_EQ(store_.mountedVolume("id-1", "one")->uuid, "v2");
    EXPECT_EQ(store_.unmountedVolumes("id-1", "one").size(), 1U);
}

TEST_F(VolumesTest, NamesAreComparedByteByByte) {
    store_.putVolumes({volume("v1", "a", VolumeState::Mounted), volume("v2", "\xd0\xb0", VolumeState::Mounted),
                       volume("v3", "A", VolumeState::Mounted)},
                      {});
    EXPECT_EQ(store_.mountedVolume("id-1", "\xd0\xb0")->uuid, "v2");
    EXPECT_EQ(store_.mounts().size(), 3U);
}

TEST_F(VolumesTest, BelongToAMountedContainer) {
    auto const failure = failureOf([&] { store_.putVolumes({{"v1", "id-9", "one", VolumeState::Mounting}}, {}); });
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->code(), Wire::ErrorCode::NoSuchContainer);
    EXPECT_EQ(failure->sentence(), "the storage container id-9 is not mounted on this host");
}

TEST_F(VolumesTest, AChangeIsOneTransactionAndUndoneUnlessCommitted) {
    HostStore other(root_, HostStore::Mode::ReadWrite, std::chrono::milliseconds{0});
    {
        HostStore::Change change(store_);
        EXPECT_FALSE(store_.volume("v1"));
        store_.putVolumes({volume("v1", "one", VolumeState::Mounting)}, {});
        EXPECT_TRUE(store_.volume("v1"));
        EXPECT_FALSE(other.volume("v1"));
        EXPECT_EQ(failureOf([&] { other.putVolumes({volume("v2", "two", VolumeState::Mounting)}, {}); })->code(),
                  Wire::ErrorCode::FileBusy);
    }
    EXPECT_FALSE(store_.volume("v1"));
    {
        HostStore::Change change(store_);
        store_.putVolumes({volume("v1", "one", VolumeState::Mounting)}, {});
        change.commit();
    }
    EXPECT_TRUE(other.volume("v1"));
    store_.putVolumes({volume("v2", "two", VolumeState::Mounting)}, {});
    EXPECT_TRUE(other.volume("v2"));
}

} // namespace
