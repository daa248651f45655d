// SPDX-License-Identifier: Apache-2.0
#include "VirtualVolumeMetaDataList.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VirtualVolumeMetaDataList;

namespace {

class MetaDataList : public CommandTest {
protected:
    MetaDataList() {
        input->SetString("container-id", "{CID}");
        input->SetString("uuid", "v-1");
        lumo.normalizeContainerId.always(Text("cid"));
        leftOver.openSessions = 1; // every call leaves its session open
    }
};

TEST_F(MetaDataList, ShowsThePairsInTheDaemonsOrderDuplicatesIncluded) {
    lumo.metadata.once(
        {0, lumo.records.metadata({{Text("z"), Text("1")}, {Text("a"), Text("")}, {Text("z"), Text("1")}})});
    run<VirtualVolumeMetaDataList>();
    std::string const printed = "[LumoMetaData{key: \"z\", value: \"1\"}, LumoMetaData{key: \"a\", value: \"\"}, "
                                "LumoMetaData{key: \"z\", value: \"1\"}]";
    expectResultAlone(printed);
    EXPECT_THAT(ranCalls,
                ElementsAre("LumoLib_Init(0, 0)", "Input.GetString(\"uuid\")", "Input.GetString(\"container-id\")",
                            "LumoLib_NormalizeContainerIdString(\"{CID}\")",
                            "LumoLib_GetLumoMetadata(\"cid\", \"v-1\", &null)", "Output.SetResult(" + printed + ")",
                            "Output.Complete()", "LumoLib_FreeLumoMetadata(result)"));
    EXPECT_EQ(Doubles::describe(output->GetResult()), "list of LumoMetaData{key: string, value: string} with elements");
}

TEST_F(MetaDataList, ShowsAnEmptyTableForAVolumeWithoutPairs) {
    run<VirtualVolumeMetaDataList>();
    expectResultAlone("[]");
}

TEST_F(MetaDataList, ReportsABadContainerIdBeforeAnEmptyUuid) {
    lumo.normalizeContainerId.once(Text());
    input->SetString("uuid", "");
    run<VirtualVolumeMetaDataList>();
    expectMessageAlone("Container Id is not valid.");
}

TEST_F(MetaDataList, ReportsAnEmptyUuid) {
    input->SetString("uuid", "");
    run<VirtualVolumeMetaDataList>();
    expectMessageAlone("Lumo UUID cannot be empty.");
    EXPECT_THAT(callsOf("LumoLib_GetLumo"), IsEmpty());
}

TEST_F(MetaDataList, ReportsMissingMetadataWithoutTheCode) {
    lumo.metadata.once({7, nullptr});
    run<VirtualVolumeMetaDataList>();
    expectMessageAlone("Failed to get the metadata for Lumo.");
    EXPECT_THAT(callsOf("LumoLib_Err"), IsEmpty());
    EXPECT_THAT(callsOf("LumoLib_Free"), IsEmpty());
}

TEST_F(MetaDataList, LeavesOneMoreSessionOpenWithEachCall) {
    auto const command = VirtualVolumeMetaDataList::New();
    EXPECT_EQ(lumo.openSessions, 0);
    command->ExecuteInternal(input, output);
    command->ExecuteInternal(input, output);
    EXPECT_EQ(lumo.openSessions, 2);
    leftOver.openSessions = 2;
}

TEST_F(MetaDataList, ThrowsBeforeAnythingIsReadWhenNoSessionCanBeOpened) {
    lumo.init.always(false);
    leftOver.openSessions = 0;
    expectNoSession([&] { run<VirtualVolumeMetaDataList>(); }, "VirtualVolumeMetaDataList", 88U);
    EXPECT_THAT(log.lines(), ElementsAre("LumoLib_Init(0, 0)"));
}

} // namespace
