// SPDX-License-Identifier: Apache-2.0
#include "OrkaContextSet.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::OrkaContextSet;

namespace {

class ContextSet : public CommandTest {
protected:
    void expectFailure(std::string const &cause) const {
        EXPECT_EQ(output->GetMessage(), "Failed to update host Orka context Uuid: " + cause);
        EXPECT_EQ(result(), "false");
        EXPECT_TRUE(output->IsComplete());
    }
};

TEST_F(ContextSet, ClearAloneClearsTheContext) {
    input->SetFlag("clear");
    run<OrkaContextSet>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetBool(\"clear\")", "Input.HasParameter(\"uuid\")",
                            "LumoFileSystemImpl.ClearOrkaContext()", "Output.SetResult(true)", "Output.Complete()"));
}

TEST_F(ContextSet, AUuidIsSetAsItWasTyped) {
    input->SetString("uuid", " Not-A-UUID ");
    run<OrkaContextSet>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetBool(\"clear\")", "Input.HasParameter(\"uuid\")", "Input.GetString(\"uuid\")",
                            "LumoFileSystemImpl.SetOrkaContext(\" Not-A-UUID \")", "Output.SetResult(true)",
                            "Output.Complete()"));
}

TEST_F(ContextSet, BothAreOneTooMany) {
    input->SetFlag("clear");
    input->SetString("uuid", "u");
    run<OrkaContextSet>();
    expectFailure("Exactly one of --clear or --uuid must be specified!");
    EXPECT_THAT(callsOf("LumoFileSystemImpl"), IsEmpty());
}

TEST_F(ContextSet, NeitherIsOneTooFew) {
    run<OrkaContextSet>();
    expectFailure("Exactly one of --clear or --uuid must be specified!");
    EXPECT_THAT(callsOf("LumoFileSystemImpl"), IsEmpty());
}

TEST_F(ContextSet, AnEmptyUuidIsRefused) {
    input->SetString("uuid", "");
    run<OrkaContextSet>();
    expectFailure("--uuid requires a parameter");
    EXPECT_THAT(callsOf("LumoFileSystemImpl"), IsEmpty());
}

TEST_F(ContextSet, ReportsAHostThatRefusesToSet) {
    input->SetString("uuid", "u");
    kestrel.setOrkaContext.throwOnce(gantryFailure("read-only"));
    run<OrkaContextSet>();
    expectFailure("read-only");
    EXPECT_THAT(callsOf("Output."),
                ElementsAre("Output.SetMessage(\"Failed to update host Orka context Uuid: read-only\")",
                            "Output.SetResult(false)", "Output.Complete()"));
}

TEST_F(ContextSet, ReportsAHostThatRefusesToClear) {
    input->SetFlag("clear");
    kestrel.clearOrkaContext.throwOnce(gantryFailure("nothing set"));
    run<OrkaContextSet>();
    expectFailure("nothing set");
}

TEST_F(ContextSet, ReportsAFailureWhileTheResultIsSet) {
    input->SetFlag("clear");
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<OrkaContextSet>();
    expectFailure("no room");
}

TEST_F(ContextSet, LetsAnUnexpectedExceptionPass) {
    input->SetFlag("clear");
    kestrel.clearOrkaContext.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<OrkaContextSet>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
    EXPECT_FALSE(output->IsComplete());
}

TEST_F(ContextSet, NeedsNoDaemon) {
    input->SetFlag("clear");
    run<OrkaContextSet>();
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

} // namespace
