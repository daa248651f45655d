// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

using namespace Orka;

class MutatingAnArrayFile : public OrkaTest {
protected:
    static VolumeSpec spec(std::string const &directoryName, int64_t sizeMb = 0,
                           std::string const &container = goldId) {
        VolumeSpec made;
        made.containerId = container;
        made.directoryName = directoryName;
        made.sizeMb = sizeMb;
        return made;
    }

    ArrayFile file_{makeArray(), std::chrono::seconds(5), countingUuids()};
};

TEST_F(MutatingAnArrayFile, createsAVolumeThatIsThereAfterReopening) {
    auto asked = spec("vm", 17);
    asked.profile = "gold";
    asked.vmUuid = "vm-9";
    auto const made = file_.createVolume("", asked);
    VirtualVolume const expected{"20000000-0000-4000-8000-000000000001",
                                 goldId,
                                 VolumeKind::Config,
                                 "vm",
                                 17,
                                 0,
                                 0,
                                 "gold",
                                 1048576,
                                 "vm-9",
                                 std::nullopt};
    EXPECT_EQ(made, expected);
    ArrayFile reopened(at("test.array"));
    EXPECT_EQ(reopened.volume(goldId, made.uuid), expected);
    EXPECT_EQ(reopened.configVolumes(goldId, 10).back().uuid, made.uuid);
}

TEST_F(MutatingAnArrayFile, keepsTheDirectoryNameAsMetadata) {
    auto const made = file_.createVolume("", spec("vm"));
    EXPECT_EQ(file_.metadata(goldId, made.uuid), (Metadata{{"directoryName", "vm"}}));
}

TEST_F(MutatingAnArrayFile, createsADataVolumeWithoutADirectoryName) {
    auto asked = spec("");
    asked.kind = VolumeKind::Data;
    auto const made = file_.createVolume("", asked);
    EXPECT_EQ(file_.volume(goldId, made.uuid).kind, VolumeKind::Data);
    EXPECT_TRUE(file_.metadata(goldId, made.uuid).empty());
    EXPECT_EQ(file_.configVolumes(goldId, 10).size(), 2U);
}

TEST_F(MutatingAnArrayFile, keepsAnEmptyProfileApartFromNone) {
    auto asked = spec("with");
    asked.profile = "";
    EXPECT_EQ(file_.volume(goldId, file_.createVolume("", asked).uuid).profile, "");
    EXPECT_EQ(file_.volume(goldId, file_.createVolume("", spec("without")).uuid).profile, std::nullopt);
}

TEST_F(MutatingAnArrayFile, givesANewVolumeTheDefaultSizeOrTheContainersMaximum) {
    EXPECT_EQ(file_.createVolume("", spec("vm")).sizeMb, 4096);
    EXPECT_EQ(file_.createVolume("", spec("vm", 0, silverId)).sizeMb, 100);
}

TEST_F(MutatingAnArrayFile, allowsTheMaximumAndNothingAbove) {
    EXPECT_EQ(file_.createVolume("", spec("fits", 100, silverId)).sizeMb, 100);
    EXPECT_EQ(failureOf([&] { file_.createVolume("", spec("vm", 101, silverId)); }),
              "a virtual volume of 101 MB is larger than the storage container 00000000-0000-4000-8000-00000000000b "
              "allows (100 MB)");
    EXPECT_EQ(codeOf([&] { file_.createVolume("", spec("vm", INT64_MAX)); }), Wire::ErrorCode::TooLarge);
    EXPECT_EQ(failureOf([&] { file_.createVolume("", spec("vm", -1)); }),
              "a virtual volume cannot have a size of -1 MB");
    EXPECT_EQ(codeOf([&] { file_.createVolume("", spec("vm", INT64_MIN)); }), Wire::ErrorCode::InvalidArgument);
    EXPECT_EQ(file_.counts().configVolumes, 3);
}

TEST_F(MutatingAnArrayFile, refusesADirectoryNameThatIsTakenInTheContainerOnly) {
    EXPECT_EQ(failureOf([&] { file_.createVolume("", spec("web")); }),
              "the storage container 00000000-0000-4000-8000-00000000000a has a config volume 'web' already");
    EXPECT_EQ(codeOf([&] { file_.createVolume("", spec("web")); }), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(file_.createVolume("", spec("web", 0, silverId)).directoryName, "web");
    EXPECT_EQ(file_.createVolume("", spec("WEB")).directoryName, "WEB");
}

TEST_F(MutatingAnArrayFile, refusesSpecificationsThatMakeNoSense) {
    auto data = spec("named");
    data.kind = VolumeKind::Data;
    auto ofNoKind = spec("vm");
    ofNoKind.kind = static_cast<VolumeKind>(7);
    auto nul = spec(std::string("a\0b", 3));
    auto nulProfile = spec("vm");
    nulProfile.profile = std::string("\0", 1);
    for (auto const &asked : {spec(""), data, ofNoKind, nul, nulProfile}) {
        EXPECT_EQ(codeOf([&] { file_.createVolume("", asked); }), Wire::ErrorCode::InvalidArgument);
    }
    EXPECT_EQ(codeOf([&] { file_.createVolume("", spec("vm", 0, noContainer)); }), Wire::ErrorCode::NoSuchContainer);
    EXPECT_EQ(file_.counts().configVolumes, 2);
}

TEST_F(MutatingAnArrayFile, deletesAVolumeWithItsMetadata) {
    file_.deleteVolume("", goldId, webId);
    EXPECT_FALSE(file_.presence(goldId, {webId})[0].exists);
    EXPECT_EQ(file_.counts().metadataPairs, 0);
    EXPECT_EQ(codeOf([&] { file_.deleteVolume("", goldId, webId); }), Wire::ErrorCode::NoSuchVolume);
}

TEST_F(MutatingAnArrayFile, freesTheDirectoryNameOfADeletedVolume) {
    file_.deleteVolume("", goldId, webId);
    EXPECT_EQ(file_.createVolume("", spec("web")).directoryName, "web");
}

TEST_F(MutatingAnArrayFile, refusesToDeleteABoundVolume) {
    EXPECT_EQ(failureOf([&] { file_.deleteVolume("", goldId, dataId); }),
              "the virtual volume 10000000-0000-4000-8000-000000000003 is bound to the protocol endpoint pe-1");
    EXPECT_EQ(codeOf([&] { file_.deleteVolume("", goldId, dataId); }), Wire::ErrorCode::InUse);
    EXPECT_TRUE(file_.presence(goldId, {dataId})[0].exists);
}

TEST_F(MutatingAnArrayFile, bindsAndUnbindsDurably) {
    file_.bindVolume("", goldId, webId, "pe-3");
    EXPECT_EQ(ArrayFile(at("test.array")).volume(goldId, webId).boundTo, "pe-3");
    file_.unbindVolume("", goldId, webId);
    EXPECT_EQ(ArrayFile(at("test.array")).volume(goldId, webId).boundTo, std::nullopt);
}

TEST_F(MutatingAnArrayFile, takesBindingAgainAndUnbindingTheUnboundAsDone) {
    file_.bindVolume("", goldId, webId, "pe-3");
    file_.bindVolume("", goldId, webId, "pe-3");
    EXPECT_EQ(file_.volume(goldId, webId).boundTo, "pe-3");
    file_.unbindVolume("", goldId, webId);
    file_.unbindVolume("", goldId, webId);
    EXPECT_EQ(file_.volume(goldId, webId).boundTo, std::nullopt);
}

TEST_F(MutatingAnArrayFile, keepsABindingFromMovingToAnotherEndpoint) {
    file_.bindVolume("", goldId, webId, "pe-3");
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", goldId, webId, "pe-1"); }), Wire::ErrorCode::InUse);
    EXPECT_EQ(file_.volume(goldId, webId).boundTo, "pe-3");
}

TEST_F(MutatingAnArrayFile, bindsOnlyThroughEndpointsOfTheContainersArraysThatAreAccessible) {
    auto const silver = file_.createVolume("", spec("vm", 1, silverId)).uuid;
    EXPECT_EQ(failureOf([&] { file_.bindVolume("", silverId, silver, "pe-1"); }),
              "no storage array of the storage container 00000000-0000-4000-8000-00000000000b has a protocol endpoint "
              "pe-1");
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", silverId, silver, "pe-1"); }), Wire::ErrorCode::NoSuchEndpoint);
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", goldId, webId, "nonsense"); }), Wire::ErrorCode::NoSuchEndpoint);
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", goldId, webId, ""); }), Wire::ErrorCode::NoSuchEndpoint);
    EXPECT_EQ(failureOf([&] { file_.bindVolume("", goldId, webId, "pe-down"); }),
              "the protocol endpoint pe-down is not accessible");
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", goldId, webId, "pe-down"); }), Wire::ErrorCode::NoAccessibleEndpoint);
    EXPECT_EQ(codeOf([&] { file_.bindVolume("", goldId, noVolume, "pe-1"); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_EQ(codeOf([&] { file_.unbindVolume("", goldId, noVolume); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_EQ(file_.counts().boundVolumes, 1);
}

TEST_F(MutatingAnArrayFile, keepsTheHostsContextUntilItIsTakenBack) {
    EXPECT_EQ(file_.hostContext(), std::nullopt);
    file_.setHostContext("nexa-1");
    EXPECT_EQ(ArrayFile(at("test.array")).hostContext(), "nexa-1");
    file_.setHostContext("");
    EXPECT_EQ(file_.hostContext(), "");
    file_.setHostContext(std::nullopt);
    EXPECT_EQ(file_.hostContext(), std::nullopt);
}

TEST_F(MutatingAnArrayFile, writesNothingWhenTheHostsContextIsToldAgain) {
    file_.setHostContext("nexa-1");
    auto const before = bytesOf(at("test.array"));
    file_.setHostContext("nexa-1");
    EXPECT_EQ(bytesOf(at("test.array")), before);
}

TEST_F(MutatingAnArrayFile, givesRandomCanonicalIdsUnlessToldOtherwise) {
    ArrayFile other(at("test.array"));
    auto const first = other.createVolume("", spec("r1")).uuid;
    auto const second = other.createVolume("", spec("r2")).uuid;
    EXPECT_NE(first, second);
    for (auto const &uuid : {first, second}) {
        ASSERT_EQ(uuid.size(), 36U);
        EXPECT_EQ(uuid[14], '4');
        EXPECT_NE(std::string("89ab").find(uuid[19]), std::string::npos);
        EXPECT_EQ(other.volume(goldId, uuid).uuid, uuid);
    }
}
