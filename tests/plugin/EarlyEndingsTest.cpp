// SPDX-License-Identifier: Apache-2.0
//
// How the daemon's settings, fault injection, the provider context and the consistency groups end when they do not
// succeed: every call of the path, in order, and none behind it.
#include "CGCreate.h"
#include "CGList.h"
#include "CGSync.h"
#include "CommandTest.h"
#include "DaemonCommand.h"
#include "FaultInjectionEnable.h"
#include "FaultInjectionRuleAdd.h"
#include "FaultInjectionRuleRemove.h"
#include "FaultInjectionRuleSet.h"
#include "OrkaContextSet.h"
#include "kestrel/Lib.h"

using namespace PluginTest;
using namespace TarselCli::LumoNamespace;

namespace {

using Lines = std::vector<std::string>;

Kestrel::Lib::KestrelException kestrelFailure() {
    return {"of the other kind", "file", 1, Gantry::Lib::QuibMessage()};
}

class DaemonEnding : public CommandTest {
protected:
    /// What every call reads first when only an outage or the switch is asked for, followed by the other lines.
    static Lines afterSettings(Lines const &others) {
        Lines lines = {"StorageInfoImpl()",
                       "Input.HasParameter(\"log-level\")",
                       "Input.GetBool(\"dump-objects\")",
                       "Input.GetBool(\"unbind-now\")",
                       "Input.HasParameter(\"unbind-period\")",
                       "Input.HasParameter(\"start-pe-apd\")"};
        lines.insert(lines.end(), others.begin(), others.end());
        lines.push_back("~StorageInfoImpl()");
        return lines;
    }
    std::string const asksForEnd = "Input.HasParameter(\"end-pe-apd\")";
    std::string const asksForSwitch = "Input.HasParameter(\"disable-spm-space-efficiency-cmds\")";
    std::string const readsSwitch = "Input.GetBool(\"disable-spm-space-efficiency-cmds\")";
};

TEST_F(DaemonEnding, AnOutageStartLooksAtNothingBehindIt) {
    input->SetString("start-pe-apd", "naa.1");
    kestrel.notifyEndpointEvent.once({"a", "b"});
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls,
              afterSettings({"Input.GetString(\"start-pe-apd\")",
                             "StorageInfoImpl.NotifyLumoProtocolEndpointEvent(\"naa.1\", 0, [])",
                             "Output.SetMessage(\"Notify PE APD command returned containers: a, b, .\\n\")"}));
}

TEST_F(DaemonEnding, AnOutageEndLooksAtNothingBehindIt) {
    input->SetString("end-pe-apd", "naa.1");
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls, afterSettings({asksForEnd, "Input.GetString(\"end-pe-apd\")",
                                       "StorageInfoImpl.NotifyLumoProtocolEndpointEvent(\"naa.1\", 1, [])",
                                       "Output.SetMessage(\"Notify PE APD command returned containers: .\\n\")"}));
}

TEST_F(DaemonEnding, AnOutageEndOfAnEndpointWithoutANameIsStillOne) {
    input->SetString("end-pe-apd", "");
    run<DaemonCommand>();
    expectMessageAlone("Notify PE APD command returned containers: .\n");
    EXPECT_THAT(callsOf("StorageInfoImpl.Notify"),
                ElementsAre("StorageInfoImpl.NotifyLumoProtocolEndpointEvent(\"\", 1, [])"));
}

TEST_F(DaemonEnding, TheSwitchIsAllThatIsSent) {
    input->SetBool("disable-spm-space-efficiency-cmds", false);
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls, afterSettings({asksForEnd, asksForSwitch, readsSwitch,
                                       "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(1)", "Output.SetResult(true)",
                                       "Output.Complete()"}));
}

TEST_F(DaemonEnding, ARefusedSwitchHasItsMessageThenCompletes) {
    input->SetBool("disable-spm-space-efficiency-cmds", true);
    lumo.setSpaceEfficiency.once(-9);
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls,
              afterSettings({asksForEnd, asksForSwitch, readsSwitch,
                             "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(0)", "LumoLib_Err2String(-9)",
                             "Output.SetMessage(\"LumoLib_SetSPMSpaceEfficiencyManipulationEnabled failed with error, "
                             "the daemon's reason\\n\")",
                             "Output.Complete()"}));
}

TEST_F(DaemonEnding, WithoutParametersNeitherAsksTheDaemonNorCompletes) {
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls,
              afterSettings({asksForEnd, asksForSwitch,
                             "Output.SetMessage(\"At least one of the parameters --log-level, --dump-objects, "
                             "--unbind-period, --unbind-now, --start-pe-apd, --end-pe-apd, "
                             "--disable-spm-space-efficiency-cmds is needed\")"}));
}

TEST_F(DaemonEnding, ARefusedSettingHasItsMessageThenCompletes) {
    input->SetInt("unbind-period", -1);
    lumo.debugCommand.once(-9);
    run<DaemonCommand>();
    EXPECT_EQ(ranCalls,
              (Lines{"StorageInfoImpl()", "Input.HasParameter(\"log-level\")", "Input.GetBool(\"dump-objects\")",
                     "Input.GetBool(\"unbind-now\")", "Input.HasParameter(\"unbind-period\")",
                     "Input.GetInt(\"unbind-period\")", "Input.HasParameter(\"start-pe-apd\")", asksForEnd,
                     asksForSwitch, "LumoLib_DebugCommand(null, null, &-1)", "LumoLib_Err2String(-9)",
                     "Output.SetMessage(\"LumoLib_DebugCommand  failed with error the daemon's reason\\n\")",
                     "Output.Complete()", "~StorageInfoImpl()"}));
}

TEST_F(DaemonEnding, AnEmptyLogLevelThatWasGivenMeansError) {
    input->SetString("log-level", "");
    run<DaemonCommand>();
    expectResultAlone("true");
    EXPECT_THAT(callsOf("LumoLib_Debug"), ElementsAre("LumoLib_DebugCommand(&4, null, null)"));
}

TEST_F(DaemonEnding, AnyExceptionOfTheHostPassesAndTheHostIsReleased) {
    input->SetString("end-pe-apd", "naa.1");
    kestrel.notifyEndpointEvent.throwOnce(kestrelFailure()).throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<DaemonCommand>(), Kestrel::Lib::KestrelException);
    EXPECT_THROW(run<DaemonCommand>(), Unexpected);
    EXPECT_EQ(log.lines().back(), "LumoLib_Exit()") << "the object's session goes with the object";
    EXPECT_THAT(callsOf("Output."), IsEmpty());
}

TEST_F(DaemonEnding, KeepsNothingOfOneCallForTheNext) {
    auto const command = DaemonCommand::New();
    input->SetString("log-level", "trivia");
    input->SetFlag("dump-objects");
    input->SetInt("unbind-period", 7);
    command->ExecuteInternal(input, output);
    renewCall();
    input->SetFlag("dump-objects");
    command->ExecuteInternal(input, output);
    EXPECT_THAT(callsOf("LumoLib_Debug"),
                ElementsAre("LumoLib_DebugCommand(&64, &1, &7)", "LumoLib_DebugCommand(null, &1, null)"));
}

class FaultEnding : public CommandTest {
protected:
    FaultEnding() {
        input->SetString("fault", "STORAGE_FAULT");
    }
    /// A call with a frequency and no operation, from opening its session to closing it.
    static Lines withFrequency(Lines const &others) {
        Lines lines = {"LumoLib_Init(0, 0)",
                       "Input.GetString(\"fault\")",
                       "Input.HasParameter(\"operation\")",
                       "Input.HasParameter(\"frequency\")",
                       "Input.GetInt(\"frequency\")",
                       "Input.HasParameter(\"time\")"};
        lines.insert(lines.end(), others.begin(), others.end());
        lines.push_back("LumoLib_Exit()");
        return lines;
    }
};

TEST_F(FaultEnding, ARefusedSwitchEndsAtItsMessage) {
    input->SetBool("enabled", true);
    lumo.setFaultInjectionEnabled.once(false);
    run<FaultInjectionEnable>();
    EXPECT_THAT(ranCalls,
                ElementsAre("LumoLib_Init(0, 0)", "Input.GetBool(\"enabled\")",
                            "LumoLib_SetFaultInjectionEnabled(true)",
                            "Output.SetMessage(\"Failed to change the fault injection status.\")", "LumoLib_Exit()"));
}

TEST_F(FaultEnding, ARuleWithoutATriggerIsNotSent) {
    input->SetInt("frequency", 0);
    run<FaultInjectionRuleAdd>();
    EXPECT_EQ(ranCalls, withFrequency({"Output.SetMessage(\"You must specify either a frequency or a maximum time to "
                                       "add a rule.\")"}));
    run<FaultInjectionRuleSet>();
    EXPECT_EQ(ranCalls, withFrequency({"Output.SetMessage(\"You must specify either a frequency or a maximum time to "
                                       "modify a rule.\")"}));
}

TEST_F(FaultEnding, ARefusedRuleHasItsMessageThenFalseThenCompletes) {
    input->SetInt("frequency", 9);
    lumo.addRule.once(false);
    run<FaultInjectionRuleAdd>();
    EXPECT_EQ(ranCalls, withFrequency({"LumoLib_AddFaultInjectionRule(\"STORAGE_FAULT\", \"*\", 9, -1)",
                                       "Output.SetMessage(\"The injection rule could not be added.\")",
                                       "Output.SetResult(false)", "Output.Complete()"}));
    lumo.modifyRule.once(false);
    run<FaultInjectionRuleSet>();
    EXPECT_EQ(ranCalls,
              withFrequency({"LumoLib_ModifyFaultInjectionRule(\"STORAGE_FAULT\", \"*\", 9, -1)",
                             "Output.SetMessage(\"The injection rule could not be modified.  Verify that the rule "
                             "exists.\")",
                             "Output.SetResult(false)", "Output.Complete()"}));
}

TEST_F(FaultEnding, ARefusedRemovalHasItsMessageThenFalseThenCompletes) {
    input->SetString("operation", "");
    lumo.modifyRule.once(false);
    run<FaultInjectionRuleRemove>();
    EXPECT_THAT(ranCalls, ElementsAre("LumoLib_Init(0, 0)", "Input.GetString(\"fault\")",
                                      "Input.HasParameter(\"operation\")", "Input.GetString(\"operation\")",
                                      "LumoLib_ModifyFaultInjectionRule(\"STORAGE_FAULT\", \"\", -1, -1)",
                                      "Output.SetMessage(\"The injection rule could not be removed.\")",
                                      "Output.SetResult(false)", "Output.Complete()", "LumoLib_Exit()"));
}

class ContextEnding : public CommandTest {
protected:
    static std::string message(std::string const &cause) {
        return "Output.SetMessage(\"Failed to update host Orka context Uuid: " + cause + "\")";
    }
};

TEST_F(ContextEnding, BothOrNeitherReadsNoUuid) {
    Lines const refused = {"Input.GetBool(\"clear\")", "Input.HasParameter(\"uuid\")",
                           message("Exactly one of --clear or --uuid must be specified!"), "Output.SetResult(false)",
                           "Output.Complete()"};
    run<OrkaContextSet>();
    EXPECT_EQ(ranCalls, refused);
    renewCall();
    input->SetFlag("clear");
    input->SetString("uuid", "");
    run<OrkaContextSet>();
    EXPECT_EQ(ranCalls, refused);
}

TEST_F(ContextEnding, AnEmptyUuidDoesNotReachTheHost) {
    input->SetString("uuid", "");
    run<OrkaContextSet>();
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetBool(\"clear\")", "Input.HasParameter(\"uuid\")", "Input.GetString(\"uuid\")",
                            message("--uuid requires a parameter"), "Output.SetResult(false)", "Output.Complete()"));
}

TEST_F(ContextEnding, AnExceptionOfAnotherKindPassesUncompleted) {
    input->SetString("uuid", "u");
    kestrel.setOrkaContext.throwOnce(kestrelFailure()).throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<OrkaContextSet>(), Kestrel::Lib::KestrelException);
    EXPECT_THROW(run<OrkaContextSet>(), Unexpected);
    EXPECT_THAT(callsOf("Output."), IsEmpty());
}

class GroupEnding : public CommandTest {};

TEST_F(GroupEnding, CreateWithoutASessionReadsItsParametersFirst) {
    lumo.init.once(true).once(false);
    run<CGCreate>();
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetString(\"name\")", "Input.GetString(\"desc\")",
                                      "Input.GetString(\"profile\")", "Input.GetString(\"vp-name\")",
                                      "LumoLib_Init(0, 0)", "Output.SetMessage(\"Failed to initialize LumoLib\")"));
}

TEST_F(GroupEnding, ListAndSyncWithoutASessionReadTheirParametersFirst) {
    Lines const refused = {"Input.GetStringList(\"cgid\")", "Input.GetString(\"vp-name\")", "LumoLib_Init(0, 0)",
                           "Output.SetMessage(\"Failed to initialize LumoLib\")"};
    lumo.init.once(false);
    run<CGList>();
    EXPECT_EQ(ranCalls, refused);
    lumo.init.once(true).once(false);
    run<CGSync>();
    EXPECT_EQ(ranCalls, refused);
}

} // namespace
