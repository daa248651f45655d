// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerCheckLumos.h"

#include "CommandTest.h"

using namespace PluginTest;
using namespace Gantry::Storage;
using TarselCli::LumoNamespace::StorageContainerCheckLumos;

namespace {

class CheckLumos : public CommandTest {
protected:
    CheckLumos() {
        input->SetString("path", "/volumes/gold");
    }
    /// The container is mounted and answers so.
    void hostAnswers(std::vector<LumoAccessibilityType> const &accessibility) {
        gold.accessibility.always(accessibility);
        kestrel.getLumoFileSystemByPath.always(gold);
    }
    FileSystemScript gold{"gold"};
};

std::string const queryLine = "LumoLib_QueryAllConfigLumos(\"gold-container\", 2147483647, 0, &null, 0)";

TEST_F(CheckLumos, ShowsTheStatusOfEachGivenVolume) {
    input->SetStringList("lumo", {"v0", "v1", "v2", "v3"});
    hostAnswers({NonExistent, Unconfirmed, Inaccessible, Accessible});
    run<StorageContainerCheckLumos>();
    std::string const printed = "[LumosAreAccessible{LumoId: \"v0\", Status: \"non-existent\"}, "
                                "LumosAreAccessible{LumoId: \"v1\", Status: \"unconfirmed\"}, "
                                "LumosAreAccessible{LumoId: \"v2\", Status: \"inaccessible\"}, "
                                "LumosAreAccessible{LumoId: \"v3\", Status: \"accessible\"}]";
    expectResultAlone(printed);
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "Input.GetString(\"path\")", "Input.GetStringList(\"lumo\")",
                                      "StorageInfoImpl.GetLumoFileSystemByPath(\"/volumes/gold\")",
                                      "fs(gold).CheckLumoAccessibility([\"v0\", \"v1\", \"v2\", \"v3\"])",
                                      "Output.SetResult(" + printed + ")", "Output.Complete()", "~fs(gold)",
                                      "~StorageInfoImpl()"));
}

TEST_F(CheckLumos, WithoutIdsAsksTheDaemonForAllConfigVolumes) {
    lumo.queryAllConfigLumos.once({0, lumo.records.query({Text("c1"), Text("c2"), Text("c3")})});
    hostAnswers({Accessible, Accessible, Unconfirmed});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[LumosAreAccessible{LumoId: \"c1\", Status: \"accessible\"}, LumosAreAccessible{LumoId: \"c2\", "
                      "Status: \"accessible\"}, LumosAreAccessible{LumoId: \"c3\", Status: \"unconfirmed\"}]");
    EXPECT_THAT(std::vector<std::string>(ranCalls.begin() + 3, ranCalls.begin() + 8),
                ElementsAre("StorageInfoImpl.GetLumoFileSystemByPath(\"/volumes/gold\")", "fs(gold).GetContainerId()",
                            queryLine, "LumoLib_FreeQueryResult(result)",
                            "fs(gold).CheckLumoAccessibility([\"c1\", \"c2\", \"c3\"])"));
}

TEST_F(CheckLumos, ShowsAnEmptyTableForAContainerWithoutConfigVolumes) {
    hostAnswers({});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[]");
    EXPECT_THAT(callsOf("LumoLib_QueryAll"), ElementsAre(queryLine));
    EXPECT_THAT(callsOf("fs(gold).Check"), ElementsAre("fs(gold).CheckLumoAccessibility([])"));
}

TEST_F(CheckLumos, ACountOfZeroOrLessHoldsNoEntries) {
    for (int32_t const count : {0, -1, INT32_MIN}) {
        renewCall();
        input->SetString("path", "/volumes/gold");
        lumo.queryAllConfigLumos.once({0, lumo.records.queryWithCount(count)});
        hostAnswers({});
        run<StorageContainerCheckLumos>();
        expectResultAlone("[]");
    }
}

TEST_F(CheckLumos, AFailedQueryIsSilentAndItsNullResultIsFreed) {
    lumo.queryAllConfigLumos.once({12, nullptr});
    hostAnswers({});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[]");
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeQueryResult(null)"));
    EXPECT_THAT(callsOf("LumoLib_Err"), IsEmpty());
    EXPECT_THAT(callsOf("fs(gold).Check"), ElementsAre("fs(gold).CheckLumoAccessibility([])"));
}

TEST_F(CheckLumos, AFailedQueryThatFilledAResultIsFreedUnread) {
    lumo.queryAllConfigLumos.once({12, lumo.records.query({Text("c1")})});
    hostAnswers({});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[]");
    EXPECT_THAT(callsOf("fs(gold).Check"), ElementsAre("fs(gold).CheckLumoAccessibility([])"));
}

TEST_F(CheckLumos, AnIdGivenTwiceHasTwoRows) {
    input->SetStringList("lumo", {"v", "v"});
    hostAnswers({Accessible, Inaccessible});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[LumosAreAccessible{LumoId: \"v\", Status: \"accessible\"}, LumosAreAccessible{LumoId: \"v\", "
                      "Status: \"inaccessible\"}]");
}

TEST_F(CheckLumos, AnUnknownAccessibilityLeavesTheStatusUnset) {
    input->SetStringList("lumo", {"a", "b", "c"});
    hostAnswers({static_cast<LumoAccessibilityType>(4), static_cast<LumoAccessibilityType>(-1),
                 static_cast<LumoAccessibilityType>(INT32_MIN)});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[LumosAreAccessible{LumoId: \"a\", Status: unset}, LumosAreAccessible{LumoId: \"b\", Status: "
                      "unset}, LumosAreAccessible{LumoId: \"c\", Status: unset}]");
}

TEST_F(CheckLumos, FewerAnswersThanIdsPairWithTheFirstIds) {
    input->SetStringList("lumo", {"a", "b", "c"});
    hostAnswers({Accessible});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[LumosAreAccessible{LumoId: \"a\", Status: \"accessible\"}]");
}

TEST_F(CheckLumos, MoreAnswersThanIdsStopAtTheIds) {
    input->SetStringList("lumo", {"a"});
    hostAnswers({Accessible, Inaccessible, Unconfirmed});
    run<StorageContainerCheckLumos>();
    expectResultAlone("[LumosAreAccessible{LumoId: \"a\", Status: \"accessible\"}]");
}

TEST_F(CheckLumos, RefusesAnUnknownPathBeforeAskingTheDaemon) {
    run<StorageContainerCheckLumos>();
    expectMessageAlone("Bad datastore path");
    EXPECT_THAT(callsOf("LumoLib_Query"), IsEmpty());
}

TEST_F(CheckLumos, ShowsTheTextOfAHostThatCannotLookUpThePath) {
    kestrel.getLumoFileSystemByPath.throwOnce(gantryFailure("no store"));
    run<StorageContainerCheckLumos>();
    expectMessageAlone("no store");
}

TEST_F(CheckLumos, ShowsTheTextOfAFailedCheckAndLeavesTheFileSystem) {
    gold.accessibility.throwAlways(gantryFailure("cannot check"));
    kestrel.getLumoFileSystemByPath.always(gold);
    input->SetStringList("lumo", {"a"});
    run<StorageContainerCheckLumos>();
    leftOver.fileSystems = 1;
    expectMessageAlone("cannot check");
    EXPECT_THAT(callsOf("~"), ElementsAre("~StorageInfoImpl()"));
}

TEST_F(CheckLumos, ShowsTheTextOfAFileSystemWithoutContainerIdAndLeavesIt) {
    gold.containerId.throwAlways(gantryFailure("no id"));
    kestrel.getLumoFileSystemByPath.always(gold);
    run<StorageContainerCheckLumos>();
    leftOver.fileSystems = 1;
    expectMessageAlone("no id");
}

TEST_F(CheckLumos, ShowsAFailureWhileTheResultIsSetAndLeavesTheFileSystem) {
    hostAnswers({});
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<StorageContainerCheckLumos>();
    leftOver.fileSystems = 1;
    expectMessageAlone("no room");
}

TEST_F(CheckLumos, ShowsAFailureWhileTheOutputCompletesAndLeavesTheFileSystem) {
    hostAnswers({});
    output->onComplete.throwOnce(gantryFailure("no room"));
    run<StorageContainerCheckLumos>();
    leftOver.fileSystems = 1;
    expectMessageBehindResult("no room", "[]");
}

TEST_F(CheckLumos, LetsAnUnexpectedExceptionPass) {
    gold.accessibility.throwAlways(Unexpected("surprise"));
    kestrel.getLumoFileSystemByPath.always(gold);
    EXPECT_THROW(run<StorageContainerCheckLumos>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

} // namespace
