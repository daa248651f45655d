// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ToolHarness.h"

namespace {

using Plexa::CallSpec::Input;
using Plexa::CallSpec::Output;
using ::testing::HasSubstr;
using ::testing::Not;

/// Each look at the clock takes a millisecond and a half.
struct TracedHarness : ToolHarness {
    TracedHarness() {
        clock = [this] { return now += std::chrono::microseconds(1500); };
        plugins.registration.plugins = {{"a \"b\".so", std::chrono::microseconds(801), std::chrono::microseconds(12)}};
        command->output->SetOutputType(Plexa::MetaObj::MetaBool::New());
        command->behaviour = [this](Input const &, Output &left) {
            if (plugins.receiver) {
                plugins.receiver({"getLumoInfo", "request-1", "/r/run/lumod.sock", 96, 2048, 2, 0,
                                  std::chrono::microseconds(1234567)});
            }
            left.SetResult(Plexa::MetaObj::MetaBool::New(true));
            left.Complete();
        };
    }
    std::chrono::microseconds now{0};
};

TEST(Trace, TellsEachStepInALine) {
    TracedHarness harness;
    EXPECT_EQ(harness.run({"--log-level", "trivia", "--root=/r", "storage", "sample", "--format=json"}), 0);
    EXPECT_EQ(harness.output, "true\n");
    EXPECT_EQ(harness.errors,
              "tovicli: trace: 1.500 run version=\"1.0.0\" request=\"request-1\"\n"
              "tovicli: trace: 3.000 plugin name=\"a \\\"b\\\".so\" loadMs=0.801 registerMs=0.012\n"
              "tovicli: trace: 4.500 parsed path=\"storage sample\" root=\"/r\" timeoutMs=30000\n"
              "tovicli: trace: 7.500 call method=\"getLumoInfo\" request=\"request-1\" socket=\"/r/run/lumod.sock\" "
              "sentBytes=96 receivedBytes=2048 replies=2 code=0 tookMs=1234.567\n"
              "tovicli: trace: 9.000 command status=0 code=0 tookMs=4.500\n"
              "tovicli: trace: 13.500 output format=\"json\" bytes=5 tookMs=3.000\n"
              "tovicli: trace: 16.500 end status=0\n");
    EXPECT_FALSE(harness.plugins.receiver) << "still traced after the run";
}

TEST(Trace, IsSilentAtOtherLevels) {
    TracedHarness harness;
    for (std::string const level : {"quiet", "info", "verbose"}) {
        EXPECT_EQ(harness.run({"--log-level", level, "storage", "sample"}), 0);
        EXPECT_EQ(harness.errors, "");
        EXPECT_FALSE(harness.plugins.receiver);
    }
}

TEST(Trace, MayBeAskedForBehindThePathAndThenTellsTheStepsBefore) {
    TracedHarness harness;
    EXPECT_EQ(harness.run({"storage", "sample", "--log-level", "trivia"}), 0);
    EXPECT_THAT(harness.errors, ::testing::StartsWith("tovicli: trace: 1.500 run version=\"1.0.0\" "
                                                      "request=\"request-1\"\n"
                                                      "tovicli: trace: 3.000 plugin "));
    EXPECT_THAT(harness.errors, HasSubstr(" call method="));
}

TEST(Trace, IsNotMeantByACommandsOwnOptionOfThatName) {
    TracedHarness harness;
    harness.command->parameter("log-level", Plexa::CallSpec::String);
    EXPECT_EQ(harness.run({"storage", "sample", "--log-level", "trivia"}), 0);
    EXPECT_EQ(harness.errors, "");
    EXPECT_EQ(harness.output, "true\n");
}

TEST(Trace, TheErrorDocumentIsALineAmongTheOthers) {
    TracedHarness harness;
    harness.command->behaviour = [](Input const &, Output &output) { output.SetMessage("a\nb"); };
    EXPECT_EQ(harness.run({"--log-level", "trivia", "--format=json", "storage", "sample"}), 1);
    EXPECT_THAT(harness.errors,
                HasSubstr("\n{\"error\":{\"message\":\"a\\nb\",\"cause\":null,\"code\":null,\"hint\":null,"
                          "\"requestId\":\"request-1\",\"warnings\":[]}}\n"));
}

TEST(RequestId, ComesFromTheEnvironmentOrIsMadeUp) {
    ToolHarness harness;
    harness.command->behaviour = [](Input const &, Output &output) { output.SetMessage("failed"); };
    harness.environment.values["TOVI_REQUEST_ID"] = "job-7:step_2.a";
    harness.run({"--format=json", "storage", "sample"});
    EXPECT_THAT(harness.errors, HasSubstr("\"requestId\":\"job-7:step_2.a\""));
    EXPECT_EQ(harness.environment.values["TOVI_REQUEST_ID"], "job-7:step_2.a");
    harness.environment.values["TOVI_REQUEST_ID"] = "";
    harness.run({"--format=json", "storage", "sample"});
    EXPECT_EQ(harness.environment.values["TOVI_REQUEST_ID"], "request-1");
}

TEST(RequestId, ThatWouldHaveToBeEscapedIsRefused) {
    for (std::string const id : {"a b", "a\"b", "a\nb", "\xc3\xa4", "a\x1b"}) {
        ToolHarness harness;
        harness.environment.values["TOVI_REQUEST_ID"] = id;
        EXPECT_EQ(harness.run({"storage", "sample"}), 2);
        EXPECT_THAT(harness.errors, HasSubstr("TOVI_REQUEST_ID: "));
        EXPECT_THAT(harness.errors, Not(HasSubstr("\x1b")));
        EXPECT_EQ(harness.command->executions, 0);
    }
    ToolHarness harness;
    harness.environment.values["TOVI_REQUEST_ID"] = std::string(129, 'a');
    EXPECT_EQ(harness.run({"storage", "sample"}), 2);
}

} // namespace
