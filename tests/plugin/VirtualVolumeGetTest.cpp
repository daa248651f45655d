// SPDX-License-Identifier: Apache-2.0
#include "VirtualVolumeGet.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VirtualVolumeGet;

namespace {

class VolumeGet : public CommandTest {
protected:
    VolumeGet() {
        input->SetString("container-id", "{CID}");
        input->SetString("uuid", "v-1");
        lumo.normalizeContainerId.always(Text("cid"));
        leftOver.openSessions = 1; // every call leaves its session open
    }
    void daemonKnows(Text const &profile, uint8_t unsharedIsValid) {
        lumo.spaceStats.always({0, lumo.records.spaceStats(4096, 1024, 512, unsharedIsValid)});
        lumo.lumoInfo.always({0, lumo.records.info(profile)});
        lumo.unsharedChunks.always({0, 1048576});
    }
};

TEST_F(VolumeGet, ShowsAllThatTheDaemonKnows) {
    daemonKnows(Text("gold profile"), 0x40);
    run<VirtualVolumeGet>();
    std::string const printed =
        "LumoInfoInternal{Container Id: \"cid\", Lumo UUID: \"v-1\", Logical Size: 4096, Committed Size: 1024, "
        "Unshared Size Valid: true, Unshared Size: 512, Storage Profile: \"gold profile\", Block Size: 1048576}";
    expectResultAlone(printed);
    EXPECT_THAT(ranCalls,
                ElementsAre("LumoLib_Init(0, 0)", "Input.GetString(\"uuid\")", "Input.GetString(\"container-id\")",
                            "LumoLib_NormalizeContainerIdString(\"{CID}\")",
                            "LumoLib_SpaceStatsForLumo(\"cid\", \"v-1\", &null)",
                            "LumoLib_FreeLumoSpaceStatsInfo(result)", "LumoLib_GetLumoInfo(\"cid\", \"v-1\", &null)",
                            "LumoLib_FreeLumoInfo(result)",
                            "LumoLib_UnsharedChunksLumo(\"cid\", \"v-1\", 0, 0, 0, 0, 0, &null)",
                            "Output.SetResult(" + printed + ")", "Output.Complete()"));
}

TEST_F(VolumeGet, ShowsNoUnsharedSizeThatIsNotValid) {
    daemonKnows(Text("p"), 0);
    run<VirtualVolumeGet>();
    expectResultAlone(
        "LumoInfoInternal{Container Id: \"cid\", Lumo UUID: \"v-1\", Logical Size: 4096, Committed Size: 1024, "
        "Unshared Size Valid: false, Unshared Size: unset, Storage Profile: \"p\", Block Size: 1048576}");
}

TEST_F(VolumeGet, ShowsNoProfileWhenThereIsNoneButABlockSize) {
    daemonKnows(Text(), 1);
    run<VirtualVolumeGet>();
    expectResultAlone(
        "LumoInfoInternal{Container Id: \"cid\", Lumo UUID: \"v-1\", Logical Size: 4096, Committed Size: 1024, "
        "Unshared Size Valid: true, Unshared Size: 512, Storage Profile: unset, Block Size: 1048576}");
}

TEST_F(VolumeGet, ShowsTheValuesAsTheyCome) {
    lumo.spaceStats.once({0, lumo.records.spaceStats(INT64_MAX, -1, INT64_MIN, 1)});
    lumo.lumoInfo.once({0, lumo.records.info(Text(""))});
    lumo.unsharedChunks.once({0, -512});
    run<VirtualVolumeGet>();
    expectResultAlone("LumoInfoInternal{Container Id: \"cid\", Lumo UUID: \"v-1\", Logical Size: 9223372036854775807, "
                      "Committed Size: -1, Unshared Size Valid: true, Unshared Size: -9223372036854775808, Storage "
                      "Profile: \"\", Block Size: -512}");
}

TEST_F(VolumeGet, ReportsABadContainerIdBeforeAnEmptyUuid) {
    lumo.normalizeContainerId.always(Text());
    for (char const *const uuid : {"v-1", ""}) {
        renewCall();
        input->SetString("uuid", uuid);
        run<VirtualVolumeGet>();
        expectMessageAlone("Container Id is not valid.");
        EXPECT_THAT(callsOf("LumoLib_Space"), IsEmpty());
    }
    leftOver.openSessions = 2;
}

TEST_F(VolumeGet, ReportsAnEmptyUuid) {
    input->SetString("uuid", "");
    run<VirtualVolumeGet>();
    expectMessageAlone("Lumo UUID cannot be empty.");
    EXPECT_THAT(callsOf("LumoLib_Space"), IsEmpty());
}

TEST_F(VolumeGet, ReportsMissingSpaceStatsWithoutTheCode) {
    lumo.spaceStats.once({7, nullptr});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get space stats for Lumo.");
    EXPECT_EQ(ranCalls.back(), "Output.SetMessage(\"Failed to get space stats for Lumo.\")");
    EXPECT_THAT(callsOf("LumoLib_Err"), IsEmpty());
    EXPECT_THAT(callsOf("LumoLib_GetLumoInfo"), IsEmpty());
}

TEST_F(VolumeGet, ReportsAMissingProfileAndDropsTheSizes) {
    lumo.lumoInfo.once({7, nullptr});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get the storage profile for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeLumoSpaceStatsInfo(result)"));
    EXPECT_THAT(callsOf("LumoLib_Unshared"), IsEmpty());
}

TEST_F(VolumeGet, ReportsAMissingBlockSizeAndDropsTheRest) {
    daemonKnows(Text("p"), 1);
    lumo.unsharedChunks.once({7, 0});
    run<VirtualVolumeGet>();
    expectMessageAlone("Failed to get block size for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Free"),
                ElementsAre("LumoLib_FreeLumoSpaceStatsInfo(result)", "LumoLib_FreeLumoInfo(result)"));
}

TEST_F(VolumeGet, LeavesOneMoreSessionOpenWithEachCall) {
    auto const command = VirtualVolumeGet::New();
    EXPECT_EQ(lumo.openSessions, 0);
    command->ExecuteInternal(input, output);
    input->SetString("uuid", "");
    command->ExecuteInternal(input, output);
    EXPECT_EQ(lumo.openSessions, 2);
    EXPECT_THAT(callsOf("LumoLib_Exit"), IsEmpty());
    leftOver.openSessions = 2;
}

TEST_F(VolumeGet, ThrowsBeforeAnythingIsReadWhenNoSessionCanBeOpened) {
    lumo.init.always(false);
    leftOver.openSessions = 0;
    expectNoSession([&] { run<VirtualVolumeGet>(); }, "VirtualVolumeGet", 102U);
    EXPECT_THAT(log.lines(), ElementsAre("LumoLib_Init(0, 0)"));
}

} // namespace
