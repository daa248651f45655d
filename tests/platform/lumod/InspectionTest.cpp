// SPDX-License-Identifier: Apache-2.0
#include <limits>

#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using Wire::ErrorCode;

class InspectionTest : public DaemonFixture {
protected:
    InspectionTest()
        : vendor_(addUsualVendor())
        , uuid_(vendor_->addVolume(containerIdOf(1), "vm")) {}

    Reply configVolumes(int32_t max) {
        return ask([max](Wire::Request::Builder request) {
            auto query = request.initQueryAllConfigLumos();
            query.setContainerId(containerIdOf(1).c_str());
            query.setMax(max);
        });
    }

    std::shared_ptr<FakeVendor> vendor_;
    std::string uuid_;
};

TEST_F(InspectionTest, SpaceStatsTellWhetherTheUnsharedSizeIsValid) {
    vendor_->volumes.at(uuid_).committedMb = 7;
    Reply const without = volumeRequest("space", uuid_);
    EXPECT_EQ(without.only().getSpaceStats().getLogicalSizeMb(), 4096);
    EXPECT_EQ(without.only().getSpaceStats().getCommittedSizeMb(), 7);
    EXPECT_FALSE(without.only().getSpaceStats().getUnsharedSizeValid());
    vendor_->volumes.at(uuid_).unsharedMb = 3;
    Reply const with = volumeRequest("space", uuid_);
    EXPECT_TRUE(with.only().getSpaceStats().getUnsharedSizeValid());
    EXPECT_EQ(with.only().getSpaceStats().getUnsharedSizeMb(), 3);
}

TEST_F(InspectionTest, AVolumeWithoutAProfileHasNone) {
    EXPECT_FALSE(volumeRequest("info", uuid_).only().getLumoInfo().hasStorageProfile());
    vendor_->volumes.at(uuid_).profile = "";
    EXPECT_TRUE(volumeRequest("info", uuid_).only().getLumoInfo().hasStorageProfile());
    vendor_->volumes.at(uuid_).profile = "gold";
    EXPECT_STREQ(volumeRequest("info", uuid_).only().getLumoInfo().getStorageProfile().cStr(), "gold");
}

TEST_F(InspectionTest, UnsharedChunksTellBlockSizeAndBitmap) {
    Reply const reply = volumeRequest("unshared", uuid_);
    EXPECT_EQ(reply.only().getUnsharedChunks().getBlockSize(), 512);
    ASSERT_EQ(reply.only().getUnsharedChunks().getBitmap().size(), 1U);
    EXPECT_EQ(reply.only().getUnsharedChunks().getBitmap()[0], 0x05);
}

TEST_F(InspectionTest, MetadataKeepsItsOrderAndItsRepetitions) {
    Reply const reply = volumeRequest("metadata", uuid_);
    auto const pairs = reply.only().getMetadata();
    ASSERT_EQ(pairs.size(), 3U);
    EXPECT_STREQ(pairs[0].getKey().cStr(), "directoryName");
    EXPECT_STREQ(pairs[0].getValue().cStr(), "vm");
    EXPECT_STREQ(pairs[1].getValue().cStr(), "one");
    EXPECT_STREQ(pairs[2].getValue().cStr(), "two");
}

TEST_F(InspectionTest, AnUnknownVolumeIsAFailureOfEachQuestion) {
    for (char const *question : {"space", "info", "unshared", "metadata"}) {
        EXPECT_EQ(volumeRequest(question, "00000000-0000-4000-8000-999999999999").code(), ErrorCode::NoSuchVolume)
            << question;
    }
}

TEST_F(InspectionTest, AVolumeIsLookedForOnAllProvidersOfItsContainer) {
    auto const other = addVendor("other");
    other->arrays = {arrayOf("a2", {})};
    other->containers = {containerOf(1, "gold", {"a2"})};
    Orka::VirtualVolume volume;
    volume.uuid = "00000000-0000-4000-9000-000000000001";
    volume.sizeMb = 11;
    other->volumes.emplace(volume.uuid, volume);
    EXPECT_EQ(volumeRequest("space", volume.uuid).only().getSpaceStats().getLogicalSizeMb(), 11);
}

TEST_F(InspectionTest, ConfigVolumesComeInOrderAndInChunks) {
    for (int number = 1; number < 2300; ++number) {
        vendor_->addVolume(containerIdOf(1), "d" + std::to_string(number));
    }
    vendor_->addVolume(containerIdOf(1), "", Orka::VolumeKind::Data);
    Reply const all = configVolumes(std::numeric_limits<int32_t>::max());
    ASSERT_EQ(all.messages.size(), 3U);
    EXPECT_EQ(all.at(2).getConfigLumos().size(), 300U);
    EXPECT_STREQ(all.at(0).getConfigLumos()[1].getDirectoryName().cStr(), "d1");
    EXPECT_EQ(configVolumes(5).only().getConfigLumos().size(), 5U);
    EXPECT_EQ(configVolumes(0).only().getConfigLumos().size(), 0U);
    EXPECT_EQ(configVolumes(-1).code(), ErrorCode::InvalidArgument);
}

TEST_F(InspectionTest, ConfigVolumesOfAnUnknownContainerAreAFailure) {
    Reply const reply = ask([](Wire::Request::Builder request) {
        auto query = request.initQueryAllConfigLumos();
        query.setContainerId(containerIdOf(9).c_str());
        query.setMax(1);
    });
    EXPECT_EQ(reply.code(), ErrorCode::NoSuchContainer);
}

TEST_F(InspectionTest, fault_21_AnUnknownVersionIsATypedFailure) {
    Reply const version = ask([](Wire::Request::Builder request) {
        request.setVersion(77);
        request.setPing();
    });
    EXPECT_EQ(version.code(), ErrorCode::UnsupportedVersion);
    EXPECT_THAT(version.sentence(), testing::HasSubstr("77"));
}

} // namespace
