// SPDX-License-Identifier: Apache-2.0
//
// Switching fault injection, and its rules.
#include <functional>

#include "CommandTest.h"
#include "FaultInjectionEnable.h"
#include "FaultInjectionRuleAdd.h"
#include "FaultInjectionRuleRemove.h"
#include "FaultInjectionRuleSet.h"

using namespace PluginTest;
using namespace TarselCli::LumoNamespace;

namespace {

class FaultEnable : public CommandTest {};

TEST_F(FaultEnable, SendsTheSwitchInsideItsOwnSession) {
    input->SetBool("enabled", true);
    run<FaultInjectionEnable>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("LumoLib_Init(0, 0)", "Input.GetBool(\"enabled\")",
                                      "LumoLib_SetFaultInjectionEnabled(true)", "Output.SetResult(true)",
                                      "Output.Complete()", "LumoLib_Exit()"));
}

TEST_F(FaultEnable, SendsFalseToo) {
    input->SetBool("enabled", false);
    run<FaultInjectionEnable>();
    expectResultAlone("true");
    EXPECT_THAT(callsOf("LumoLib_Set"), ElementsAre("LumoLib_SetFaultInjectionEnabled(false)"));
}

TEST_F(FaultEnable, ARefusalHasAMessageAndNoResult) {
    lumo.setFaultInjectionEnabled.once(false);
    run<FaultInjectionEnable>();
    expectMessageAlone("Failed to change the fault injection status.");
    EXPECT_EQ(ranCalls.back(), "LumoLib_Exit()");
}

struct Rule {
    char const *title;
    std::function<boost::shared_ptr<Plexa::AutoCli::Command>()> make;
    char const *request;
    Doubles::Answers<bool> Doubles::LumoDouble::*answer;
    char const *missingText;
    char const *refusedText;
};

void PrintTo(Rule const &rule, std::ostream *stream) {
    *stream << rule.request;
}

class FaultRule : public CommandTest, public testing::WithParamInterface<Rule> {
protected:
    FaultRule() {
        input->SetString("fault", "STORAGE_FAULT");
    }
    void runIt() {
        auto const command = GetParam().make();
        log.clear();
        command->ExecuteInternal(input, output);
        ranCalls = log.lines();
    }
    std::string lineOf(std::string const &arguments) const {
        return std::string(GetParam().request) + "(" + arguments + ")";
    }
    std::vector<std::string> requests() const {
        return callsOf(GetParam().request);
    }
};

TEST_P(FaultRule, IsSentWithBothTriggersInsideItsOwnSession) {
    input->SetString("operation", "createVirtualVolume");
    input->SetInt("frequency", 3);
    input->SetInt("time", 500);
    runIt();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("LumoLib_Init(0, 0)", "Input.GetString(\"fault\")", "Input.HasParameter(\"operation\")",
                            "Input.GetString(\"operation\")", "Input.HasParameter(\"frequency\")",
                            "Input.GetInt(\"frequency\")", "Input.HasParameter(\"time\")", "Input.GetInt(\"time\")",
                            lineOf("\"STORAGE_FAULT\", \"createVirtualVolume\", 3, 500"), "Output.SetResult(true)",
                            "Output.Complete()", "LumoLib_Exit()"));
}

TEST_P(FaultRule, PassesMinusOneForATriggerThatWasNotGiven) {
    input->SetInt("time", 500);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"STORAGE_FAULT\", \"*\", -1, 500")));
    renewCall();
    input->SetString("fault", "TIMEOUT");
    input->SetInt("frequency", 7);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"TIMEOUT\", \"*\", 7, -1")));
}

TEST_P(FaultRule, PassesTheOtherTriggerAsItStands) {
    input->SetInt("frequency", 3);
    input->SetInt("time", 0);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"STORAGE_FAULT\", \"*\", 3, 0")));
    input->SetInt("frequency", -20);
    input->SetInt("time", 1);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"STORAGE_FAULT\", \"*\", -20, 1")));
}

TEST_P(FaultRule, PassesAnEmptyOperationThatWasGiven) {
    input->SetString("operation", "");
    input->SetInt("frequency", 1);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"STORAGE_FAULT\", \"\", 1, -1")));
}

TEST_P(FaultRule, NeedsATriggerAboveZero) {
    struct Triggers {
        int64_t frequency;
        int64_t timeMs;
    };
    for (Triggers const &triggers : {Triggers{0, 0}, Triggers{-1, -1}, Triggers{0, -5}, Triggers{INT32_MIN, 0}}) {
        renewCall();
        input->SetInt("frequency", triggers.frequency);
        input->SetInt("time", triggers.timeMs);
        runIt();
        expectMessageAlone(GetParam().missingText);
        EXPECT_THAT(requests(), IsEmpty());
        EXPECT_EQ(ranCalls.back(), "LumoLib_Exit()");
    }
    renewCall();
    runIt();
    expectMessageAlone(GetParam().missingText);
}

TEST_P(FaultRule, KeepsTheLow32BitsOfATriggerAndTestsThose) {
    input->SetInt("frequency", int64_t{1} << 32);
    input->SetInt("time", int64_t{1} << 31);
    runIt();
    expectMessageAlone(GetParam().missingText);
    renewCall();
    input->SetString("fault", "TIMEOUT");
    input->SetInt("frequency", (int64_t{1} << 32) + 2);
    runIt();
    EXPECT_THAT(requests(), ElementsAre(lineOf("\"TIMEOUT\", \"*\", 2, -1")));
}

TEST_P(FaultRule, ThatIsRefusedHasAMessageAndTheResultFalse) {
    (lumo.*(GetParam().answer)).once(false);
    input->SetInt("frequency", 1);
    runIt();
    EXPECT_EQ(output->GetMessage(), GetParam().refusedText);
    EXPECT_EQ(result(), "false");
    EXPECT_TRUE(output->IsComplete());
    EXPECT_EQ(ranCalls.back(), "LumoLib_Exit()");
}

INSTANTIATE_TEST_SUITE_P(
    , FaultRule,
    testing::Values(Rule{"Add", FaultInjectionRuleAdd::New, "LumoLib_AddFaultInjectionRule",
                         &Doubles::LumoDouble::addRule,
                         "You must specify either a frequency or a maximum time to add a rule.",
                         "The injection rule could not be added."},
                    Rule{"Set", FaultInjectionRuleSet::New, "LumoLib_ModifyFaultInjectionRule",
                         &Doubles::LumoDouble::modifyRule,
                         "You must specify either a frequency or a maximum time to modify a rule.",
                         "The injection rule could not be modified.  Verify that the rule exists."}),
    [](auto const &rule) { return std::string(rule.param.title); });

class FaultRuleRemove : public CommandTest {
protected:
    FaultRuleRemove() {
        input->SetString("fault", "STORAGE_FAULT");
    }
};

TEST_F(FaultRuleRemove, SendsMinusOneTwice) {
    run<FaultInjectionRuleRemove>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("LumoLib_Init(0, 0)", "Input.GetString(\"fault\")", "Input.HasParameter(\"operation\")",
                            "LumoLib_ModifyFaultInjectionRule(\"STORAGE_FAULT\", \"*\", -1, -1)",
                            "Output.SetResult(true)", "Output.Complete()", "LumoLib_Exit()"));
}

TEST_F(FaultRuleRemove, NamesTheOperationThatWasGiven) {
    input->SetString("operation", "bindVirtualVolume");
    run<FaultInjectionRuleRemove>();
    EXPECT_THAT(callsOf("LumoLib_Mod"),
                ElementsAre("LumoLib_ModifyFaultInjectionRule(\"STORAGE_FAULT\", \"bindVirtualVolume\", -1, -1)"));
}

TEST_F(FaultRuleRemove, ARefusalHasAMessageAndTheResultFalse) {
    lumo.modifyRule.once(false);
    run<FaultInjectionRuleRemove>();
    EXPECT_EQ(output->GetMessage(), "The injection rule could not be removed.");
    EXPECT_EQ(result(), "false");
    EXPECT_TRUE(output->IsComplete());
    EXPECT_EQ(ranCalls.back(), "LumoLib_Exit()");
}

struct Refused {
    std::function<boost::shared_ptr<Plexa::AutoCli::Command>()> make;
    char const *unit;
    unsigned line;
};

void PrintTo(Refused const &refused, std::ostream *stream) {
    *stream << refused.unit;
}

class FaultSession : public CommandTest, public testing::WithParamInterface<Refused> {};

TEST_P(FaultSession, ThatCannotBeOpenedThrowsBeforeAnythingIsRead) {
    lumo.init.always(false);
    auto const command = GetParam().make();
    expectNoSession([&] { command->ExecuteInternal(input, output); }, GetParam().unit, GetParam().line);
    EXPECT_THAT(log.lines(), ElementsAre("LumoLib_Init(0, 0)"));
}

TEST_P(FaultSession, IsClosedWhenAnExceptionPasses) {
    auto const command = GetParam().make();
    input->SetInt("frequency", 1);
    output->onSetResult.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(command->ExecuteInternal(input, output), Unexpected);
}

INSTANTIATE_TEST_SUITE_P(, FaultSession,
                         testing::Values(Refused{FaultInjectionEnable::New, "FaultInjectionEnable", 68},
                                         Refused{FaultInjectionRuleAdd::New, "FaultInjectionRuleAdd", 93},
                                         Refused{FaultInjectionRuleSet::New, "FaultInjectionRuleSet", 93},
                                         Refused{FaultInjectionRuleRemove::New, "FaultInjectionRuleRemove", 76}),
                         [](auto const &refused) { return std::string(refused.param.unit); });

} // namespace
