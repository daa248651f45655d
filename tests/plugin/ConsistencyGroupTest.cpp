// SPDX-License-Identifier: Apache-2.0
//
// The five placeholders: they read their parameters, ask nobody, and answer with a fixed value.
#include "CGAdd.h"
#include "CGCreate.h"
#include "CGDelete.h"
#include "CGList.h"
#include "CGSync.h"
#include "CommandTest.h"

#include <boost/pointer_cast.hpp>

using namespace PluginTest;
using namespace TarselCli::LumoNamespace;

namespace {

class ConsistencyGroup : public CommandTest {
protected:
    void giveLists() {
        input->SetStringList("cgid", {"g1", "g2"});
        input->SetString("vp-name", "north");
    }
};

TEST_F(ConsistencyGroup, CreateAnswersWithAnEmptyRecordAndLeavesItsSessionOpen) {
    input->SetString("name", "group");
    input->SetString("vp-name", "north");
    run<CGCreate>();
    leftOver.openSessions = 1;
    std::string const record = "CGCreate{Name: \"\", Description: \"\", Id: \"\", DestinationArrayId: \"\", "
                               "FailoverArrayId: \"\", SourceArrayId: \"\", State: \"\"}";
    expectResultAlone(record);
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetString(\"name\")", "Input.GetString(\"desc\")",
                                      "Input.GetString(\"profile\")", "Input.GetString(\"vp-name\")",
                                      "LumoLib_Init(0, 0)", "Output.SetResult(" + record + ")", "Output.Complete()"));
}

TEST_F(ConsistencyGroup, EveryCreateLeavesOneMoreSessionOpen) {
    auto const command = CGCreate::New();
    for (int calls = 1; calls <= 3; ++calls) {
        command->ExecuteInternal(input, output);
        EXPECT_EQ(lumo.openSessions, 1 + calls);
    }
    leftOver.openSessions = 3;
}

TEST_F(ConsistencyGroup, CreateReportsASessionThatCannotBeOpened) {
    lumo.init.once(true).once(false);
    run<CGCreate>();
    expectMessageAlone("Failed to initialize LumoLib");
}

TEST_F(ConsistencyGroup, AddSucceedsWhateverItIsGiven) {
    input->SetString("cgid", "never created");
    input->SetStringList("lumoids", {"v1", "", "v2"});
    run<CGAdd>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetString(\"cgid\")", "Input.GetStringList(\"lumoids\")",
                                      "Input.GetString(\"vp-name\")", "Output.SetResult(true)", "Output.Complete()"));
}

TEST_F(ConsistencyGroup, DeleteSucceedsWhateverItIsGiven) {
    input->SetString("cgid", "never created");
    run<CGDelete>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetString(\"cgid\")", "Input.GetString(\"vp-name\")",
                                      "Output.SetResult(true)", "Output.Complete()"));
}

TEST_F(ConsistencyGroup, ListAnswersWithAnEmptyListAndLeavesItsSessionOpen) {
    giveLists();
    run<CGList>();
    leftOver.openSessions = 1;
    expectResultAlone("[]");
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetStringList(\"cgid\")", "Input.GetString(\"vp-name\")",
                                      "LumoLib_Init(0, 0)", "Output.SetResult([])", "Output.Complete()"));
    EXPECT_EQ(Doubles::describe(output->GetResult()),
              "list of CGList{CgId: string, Name: string, Description: string, DestinationArrayId: string, "
              "FailOverArrayId: string, SourceArrayId: string, State: string, Warning: string, Error: string}");
}

TEST_F(ConsistencyGroup, SyncAnswersWithAnEmptyListAndLeavesItsSessionOpen) {
    giveLists();
    run<CGSync>();
    leftOver.openSessions = 1;
    expectResultAlone("[]");
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetStringList(\"cgid\")", "Input.GetString(\"vp-name\")",
                                      "LumoLib_Init(0, 0)", "Output.SetResult([])", "Output.Complete()"));
    EXPECT_EQ(Doubles::describe(output->GetResult()),
              "list of CGSync{CgId: string, RpId: string, TimeStamp: string, Warning: string, Error: string}");
}

TEST_F(ConsistencyGroup, EveryListAndSyncLeavesOneMoreSessionOpen) {
    auto const list = CGList::New();
    auto const sync = CGSync::New();
    EXPECT_EQ(lumo.openSessions, 1);
    list->ExecuteInternal(input, output);
    EXPECT_EQ(lumo.openSessions, 2);
    sync->ExecuteInternal(input, output);
    EXPECT_EQ(lumo.openSessions, 3);
    list->ExecuteInternal(input, output);
    EXPECT_EQ(lumo.openSessions, 4);
    leftOver.openSessions = 3;
}

TEST_F(ConsistencyGroup, ListReportsASessionThatCannotBeOpened) {
    lumo.init.once(false);
    run<CGList>();
    expectMessageAlone("Failed to initialize LumoLib");
}

TEST_F(ConsistencyGroup, SyncReportsASessionThatCannotBeOpened) {
    lumo.init.once(true).once(false);
    run<CGSync>();
    expectMessageAlone("Failed to initialize LumoLib");
}

TEST_F(ConsistencyGroup, LeavesTheHostAlone) {
    run<CGCreate>();
    run<CGAdd>();
    run<CGDelete>();
    run<CGList>();
    run<CGSync>();
    leftOver.openSessions = 3;
    EXPECT_EQ(kestrel.liveHosts, 0);
    EXPECT_THAT(callsOf("StorageInfoImpl"), IsEmpty());
}

} // namespace
