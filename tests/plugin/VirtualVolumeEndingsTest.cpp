// SPDX-License-Identifier: Apache-2.0
//
// How the inspection of a virtual volume ends early: every call up to the message and none behind it, and what becomes
// of the daemon's answers.
#include "CommandTest.h"
#include "VirtualVolumeGet.h"
#include "VirtualVolumeMetaDataList.h"

using namespace PluginTest;
using namespace TarselCli::LumoNamespace;

namespace {

using Lines = std::vector<std::string>;

class VolumeEnding : public CommandTest {
protected:
    VolumeEnding() {
        input->SetString("container-id", "{CID}");
        input->SetString("uuid", "v-1");
        lumo.normalizeContainerId.always(Text("cid"));
        leftOver.openSessions = 1; // every call leaves its session open
    }
    /// What both commands do before they ask the daemon about the volume, followed by the other lines.
    static Lines afterReading(Lines const &others) {
        Lines lines = {"LumoLib_Init(0, 0)", "Input.GetString(\"uuid\")", "Input.GetString(\"container-id\")",
                       "LumoLib_NormalizeContainerIdString(\"{CID}\")"};
        lines.insert(lines.end(), others.begin(), others.end());
        return lines;
    }
    static std::string message(std::string const &text) {
        return "Output.SetMessage(\"" + text + "\")";
    }

    Lines const sizesRead = {"LumoLib_SpaceStatsForLumo(\"cid\", \"v-1\", &null)",
                             "LumoLib_FreeLumoSpaceStatsInfo(result)"};
};

template <class Command>
class VolumeCommandEnding : public VolumeEnding {};

using VolumeCommands = testing::Types<VirtualVolumeGet, VirtualVolumeMetaDataList>;
TYPED_TEST_SUITE(VolumeCommandEnding, VolumeCommands);

TYPED_TEST(VolumeCommandEnding, AsksNothingAboutAVolumeInABadContainer) {
    for (char const *const uuid : {"v-1", ""}) {
        this->renewCall();
        this->input->SetString("container-id", "{CID}");
        this->input->SetString("uuid", uuid);
        this->lumo.normalizeContainerId.once(Text());
        this->template run<TypeParam>();
        this->expectMessageAlone("Container Id is not valid.");
        EXPECT_EQ(this->ranCalls, this->afterReading({this->message("Container Id is not valid.")}));
    }
    this->leftOver.openSessions = 2;
}

TYPED_TEST(VolumeCommandEnding, AsksNothingAboutAVolumeWithoutAUuid) {
    this->input->SetString("uuid", "");
    this->template run<TypeParam>();
    this->expectMessageAlone("Lumo UUID cannot be empty.");
    EXPECT_EQ(this->ranCalls, this->afterReading({this->message("Lumo UUID cannot be empty.")}));
}

TEST_F(VolumeEnding, StopsAtMissingSizes) {
    lumo.spaceStats.once({-1, nullptr});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get space stats for Lumo.");
    EXPECT_EQ(ranCalls, afterReading({sizesRead[0], message("Failed to get space stats for Lumo.")}));
}

TEST_F(VolumeEnding, StopsAtAMissingProfileWithTheSizesReleased) {
    lumo.lumoInfo.once({-1, nullptr});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get the storage profile for Lumo.");
    EXPECT_EQ(ranCalls, afterReading({sizesRead[0], sizesRead[1], "LumoLib_GetLumoInfo(\"cid\", \"v-1\", &null)",
                                      message("Failed to get the storage profile for Lumo.")}));
}

TEST_F(VolumeEnding, StopsAtAMissingBlockSizeWithSizesAndProfileReleased) {
    lumo.unsharedChunks.once({-1, 4096});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get block size for Lumo.");
    EXPECT_EQ(ranCalls, afterReading({sizesRead[0], sizesRead[1], "LumoLib_GetLumoInfo(\"cid\", \"v-1\", &null)",
                                      "LumoLib_FreeLumoInfo(result)",
                                      "LumoLib_UnsharedChunksLumo(\"cid\", \"v-1\", 0, 0, 0, 0, 0, &null)",
                                      message("Failed to get block size for Lumo.")}));
}

TEST_F(VolumeEnding, StopsAtMissingMetadata) {
    lumo.metadata.once({-1, nullptr});
    run<VirtualVolumeMetaDataList>();
    expectMessageAlone("Failed to get the metadata for Lumo.");
    EXPECT_EQ(ranCalls, afterReading({"LumoLib_GetLumoMetadata(\"cid\", \"v-1\", &null)",
                                      message("Failed to get the metadata for Lumo.")}));
}

// A failed request hands nothing out. What it leaves in the pointer all the same is not the caller's, and may be gone.
TEST_F(VolumeEnding, TouchesNoSizesOfAFailedRequest) {
    lumo.spaceStats.once({7, lumo.records.spaceStats(1, 2, 3, 1)});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get space stats for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Free"), IsEmpty());
    leftOver.results = 1;
}

TEST_F(VolumeEnding, TouchesNoProfileOfAFailedRequest) {
    lumo.lumoInfo.once({7, lumo.records.info(Text("p"))});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get the storage profile for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeLumoSpaceStatsInfo(result)"));
    leftOver.results = 1;
}

TEST_F(VolumeEnding, TouchesNoMetadataOfAFailedRequest) {
    lumo.metadata.once({7, lumo.records.metadata({{Text("k"), Text("v")}})});
    run<VirtualVolumeMetaDataList>();
    expectMessageAlone("Failed to get the metadata for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Free"), IsEmpty());
    leftOver.results = 1;
}

TEST_F(VolumeEnding, ReleasesTheMetadataWhenAnExceptionPasses) {
    lumo.metadata.once({0, lumo.records.metadata({{Text("k"), Text("v")}})});
    output->onSetResult.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VirtualVolumeMetaDataList>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeLumoMetadata(result)"));
}

TEST_F(VolumeEnding, HasAllAnswersReleasedWhenAnExceptionPasses) {
    output->onSetResult.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VirtualVolumeGet>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
    EXPECT_THAT(callsOf("LumoLib_Free"),
                ElementsAre("LumoLib_FreeLumoSpaceStatsInfo(result)", "LumoLib_FreeLumoInfo(result)"));
}

TEST_F(VolumeEnding, KeepsNothingOfOneCallForTheNext) {
    auto const get = VirtualVolumeGet::New();
    lumo.spaceStats.once({0, lumo.records.spaceStats(8, 4, 2, 1)});
    lumo.lumoInfo.once({0, lumo.records.info(Text("p"))});
    get->ExecuteInternal(input, output);
    renewCall();
    input->SetString("container-id", "{CID}");
    input->SetString("uuid", "v-2");
    get->ExecuteInternal(input, output);
    expectResultAlone("LumoInfoInternal{Container Id: \"cid\", Lumo UUID: \"v-2\", Logical Size: 0, Committed Size: 0, "
                      "Unshared Size Valid: false, Unshared Size: unset, Storage Profile: unset, Block Size: 0}");
    leftOver.openSessions = 2;
}

} // namespace
