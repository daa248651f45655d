// SPDX-License-Identifier: Apache-2.0
#include "DaemonCommand.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::DaemonCommand;

namespace {

class DaemonSet : public CommandTest {
protected:
    /// What the one debug request carried; empty when there was none.
    std::vector<std::string> requests() const {
        return callsOf("LumoLib_DebugCommand");
    }
};

TEST_F(DaemonSet, SendsEverySettingThatIsGiven) {
    input->SetString("log-level", "warning");
    input->SetFlag("dump-objects");
    input->SetInt("unbind-period", 250000);
    run<DaemonCommand>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("StorageInfoImpl()", "Input.HasParameter(\"log-level\")", "Input.GetString(\"log-level\")",
                            "Input.GetBool(\"dump-objects\")", "Input.GetBool(\"unbind-now\")",
                            "Input.HasParameter(\"unbind-period\")", "Input.GetInt(\"unbind-period\")",
                            "Input.HasParameter(\"start-pe-apd\")", "Input.HasParameter(\"end-pe-apd\")",
                            "Input.HasParameter(\"disable-spm-space-efficiency-cmds\")",
                            "LumoLib_DebugCommand(&8, &1, &250000)", "Output.SetResult(true)", "Output.Complete()",
                            "~StorageInfoImpl()"));
}

TEST_F(DaemonSet, SendsOneSettingAloneWithoutTheOthers) {
    input->SetString("log-level", "panic");
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(&2, null, null)"));
    renewCall();
    input->SetFlag("dump-objects");
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, &1, null)"));
    renewCall();
    input->SetInt("unbind-period", 0);
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, null, &0)"));
    renewCall();
    input->SetFlag("unbind-now");
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, null, &0)"));
}

TEST_F(DaemonSet, KnowsEveryLogLevelInAnyCase) {
    struct Word {
        char const *keyword;
        unsigned level;
    };
    auto const command = DaemonCommand::New();
    for (Word const &word : {Word{"panic", 2},
                             {"quiet", 1},
                             {"error", 4},
                             {"warning", 8},
                             {"info", 16},
                             {"verbose", 32},
                             {"trivia", 64},
                             {"VERBOSE", 32},
                             {"Info", 16},
                             {"tRiViA", 64},
                             {"loud", 4},
                             {"", 4},
                             {"panic ", 4},
                             {"warn", 4},
                             {"verbosely", 4}}) {
        EXPECT_EQ(command->GetLogLevelInt(word.keyword), word.level) << word.keyword;
    }
}

TEST_F(DaemonSet, TakesAnUnknownLogLevelForErrorWithoutAWord) {
    input->SetString("log-level", "loud");
    run<DaemonCommand>();
    expectResultAlone("true");
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(&4, null, null)"));
}

TEST_F(DaemonSet, UnbindingNowOverridesAPeriod) {
    input->SetFlag("unbind-now");
    input->SetInt("unbind-period", 100);
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, null, &0)"));
    EXPECT_THAT(callsOf("Input.HasParameter(\"unbind-period\")"), IsEmpty());
    EXPECT_THAT(callsOf("Input.GetInt"), IsEmpty());
}

TEST_F(DaemonSet, KeepsTheLow32BitsOfAPeriod) {
    input->SetInt("unbind-period", (int64_t{1} << 32) + 5);
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, null, &5)"));
    input->SetInt("unbind-period", int64_t{1} << 31);
    run<DaemonCommand>();
    EXPECT_THAT(requests(), ElementsAre("LumoLib_DebugCommand(null, null, &-2147483648)"));
}

TEST_F(DaemonSet, ReportsAFailedRequestAndCompletes) {
    input->SetFlag("dump-objects");
    lumo.debugCommand.once(5);
    lumo.err2String.once(Text("Not running"));
    run<DaemonCommand>();
    EXPECT_EQ(output->GetMessage(), "LumoLib_DebugCommand  failed with error Not running\n");
    EXPECT_EQ(result(), "none");
    EXPECT_TRUE(output->IsComplete());
    EXPECT_THAT(callsOf("LumoLib_Err"), ElementsAre("LumoLib_Err2String(5)"));
    EXPECT_EQ(callsOf("Output.").back(), "Output.Complete()");
}

TEST_F(DaemonSet, AFailureWithoutATextEndsBehindThePrefix) {
    input->SetFlag("dump-objects");
    lumo.debugCommand.once(5);
    lumo.err2String.always(Text());
    run<DaemonCommand>();
    EXPECT_EQ(output->GetMessage(), "LumoLib_DebugCommand  failed with error ");
    renewCall();
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    lumo.setSpaceEfficiency.once(5);
    run<DaemonCommand>();
    EXPECT_EQ(output->GetMessage(), "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled failed with error, ");
}

TEST_F(DaemonSet, AnOutageStartIsAllThatIsDone) {
    input->SetString("start-pe-apd", "naa.1");
    input->SetString("end-pe-apd", "naa.2");
    input->SetString("log-level", "info");
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    kestrel.notifyEndpointEvent.once({"a", "b"});
    run<DaemonCommand>();
    expectMessageAlone("Notify PE APD command returned containers: a, b, .\n");
    EXPECT_THAT(callsOf("StorageInfoImpl."),
                ElementsAre("StorageInfoImpl.NotifyLumoProtocolEndpointEvent(\"naa.1\", 0, [])"));
    EXPECT_EQ(log.count("LumoLib_DebugCommand") + log.count("LumoLib_SetSPM"), 0U);
}

TEST_F(DaemonSet, AnOutageEndComesSecond) {
    input->SetString("end-pe-apd", "naa.2");
    input->SetFlag("dump-objects");
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    run<DaemonCommand>();
    expectMessageAlone("Notify PE APD command returned containers: .\n");
    EXPECT_THAT(callsOf("StorageInfoImpl."),
                ElementsAre("StorageInfoImpl.NotifyLumoProtocolEndpointEvent(\"naa.2\", 1, [])"));
    EXPECT_EQ(log.count("LumoLib_DebugCommand") + log.count("LumoLib_SetSPM"), 0U);
}

TEST_F(DaemonSet, AnOutageOfAnEndpointWithoutANameIsStillOne) {
    input->SetString("start-pe-apd", "");
    run<DaemonCommand>();
    expectMessageAlone("Notify PE APD command returned containers: .\n");
}

TEST_F(DaemonSet, AHostThatCannotBeToldOfAnOutagePasses) {
    for (char const *const parameter : {"start-pe-apd", "end-pe-apd"}) {
        renewCall();
        input->SetString(parameter, "naa.1");
        kestrel.notifyEndpointEvent.throwOnce(gantryFailure("no such endpoint"));
        EXPECT_THROW(run<DaemonCommand>(), Gantry::Lib::GantryException);
        EXPECT_FALSE(output->HasMessage());
    }
}

TEST_F(DaemonSet, DisablingSpaceEfficiencySendsTheNegation) {
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    input->SetString("log-level", "info");
    run<DaemonCommand>();
    expectResultAlone("true");
    EXPECT_THAT(callsOf("LumoLib_S"), ElementsAre("LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(0)"));
    EXPECT_THAT(requests(), IsEmpty());
    renewCall();
    input->SetBool("disable-spm-space-efficiency-cmds", false);
    run<DaemonCommand>();
    expectResultAlone("true");
    EXPECT_THAT(callsOf("LumoLib_S"), ElementsAre("LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(1)"));
}

TEST_F(DaemonSet, ReportsARefusedSpaceEfficiencySwitchAndCompletes) {
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    lumo.setSpaceEfficiency.once(3);
    lumo.err2String.once(Text("Refused"));
    run<DaemonCommand>();
    EXPECT_EQ(output->GetMessage(), "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled failed with error, Refused\n");
    EXPECT_EQ(result(), "none");
    EXPECT_TRUE(output->IsComplete());
}

TEST_F(DaemonSet, WithoutParametersSaysWhichThereAre) {
    run<DaemonCommand>();
    expectMessageAlone("At least one of the parameters --log-level, --dump-objects, --unbind-period, --unbind-now, "
                       "--start-pe-apd, --end-pe-apd, --disable-spm-space-efficiency-cmds is needed");
    EXPECT_THAT(requests(), IsEmpty());
}

} // namespace
