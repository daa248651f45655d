// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Samples.h"
#include "ToolHarness.h"

namespace {

using Plexa::CallSpec::Input;
using Plexa::CallSpec::Output;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::StartsWith;

/// A harness whose command prints two containers.
struct ListHarness : ToolHarness {
    ListHarness() {
        command->output->SetOutputType(Samples::containersSchema());
        command->SetDefaultOutputFormatter("simple");
        command->SetDefaultOutputParameter("header:Container", "%Container Name%");
        command->SetDefaultOutputParameter("fields:Container", "Container Name,Max Size");
        command->SetDefaultOutputParameter("table-columns", "Container Name,Max Size");
        command->behaviour = [](Input const &, Output &left) {
            left.SetResult(Samples::twoContainers().value);
            left.Complete();
        };
    }
};

TEST(Tool, fault_1_EmptyArgumentListIsAUsageError) {
    ToolHarness harness;
    EXPECT_EQ(harness.runArguments({}), 2);
    EXPECT_EQ(harness.output, "");
    EXPECT_THAT(harness.errors, StartsWith("tovicli: the argument list is empty"));
}

TEST(Tool, fault_2_HugeArgumentIsACleanError) {
    ToolHarness harness;
    EXPECT_EQ(harness.run({"storage", "sample", std::string(2000000, 'x')}), 2);
    EXPECT_EQ(harness.errors, "tovicli: argument 3 is too long: 2000000 bytes, at most 131072 are taken "
                              "(try 'tovicli --help')\n");
    EXPECT_THAT(harness.plugins.directories, IsEmpty());
}

TEST(Tool, fault_3_InvalidUtf8IsRejectedAndShownEscaped) {
    ToolHarness harness;
    EXPECT_EQ(harness.run({"storage", "a\xff\x1b"}), 2);
    EXPECT_THAT(harness.errors, StartsWith("tovicli: argument 2 is not valid UTF-8: 'a\\xff\\x1b' (try"));
    EXPECT_THAT(harness.plugins.directories, IsEmpty());
}

TEST(Tool, VersionAndBadGlobalOptionsLoadNoPlugin) {
    ToolHarness harness;
    EXPECT_EQ(harness.run({"--version"}), 0);
    EXPECT_THAT(harness.output, StartsWith("tovicli "));
    EXPECT_EQ(harness.run({"--format", "json", "--version", "storage"}), 0);
    for (std::vector<std::string> const &words : std::vector<std::vector<std::string>>{{"--bogus"},
                                                                                       {"--format", "yml", "storage"},
                                                                                       {"--timeout=0"},
                                                                                       {"--log-level=loud"},
                                                                                       {"--root="},
                                                                                       {"--format-param", "x"},
                                                                                       {"--root"},
                                                                                       {"--root=/a", "--root=/b"}}) {
        EXPECT_EQ(harness.run(words), 2) << words[0];
        EXPECT_EQ(harness.output, "");
    }
    EXPECT_THAT(harness.plugins.directories, IsEmpty());
}

TEST(Tool, VersionBehindThePathIsPrintedToo) {
    ToolHarness harness;
    EXPECT_EQ(harness.run({"storage", "sample", "--version"}), 0);
    EXPECT_THAT(harness.output, StartsWith("tovicli "));
    EXPECT_EQ(harness.command->executions, 0);
}

TEST(Tool, UsesTheFormatThatTheCommandNames) {
    ListHarness harness;
    EXPECT_EQ(harness.run({"storage", "sample"}), 0);
    EXPECT_EQ(harness.output, "gold\n  Container Name: gold\n  Max Size: 4096\n"
                              "\nsilver\n  Container Name: silver\n  Max Size: 65536\n");
    harness.command->SetDefaultOutputFormatter("no such format");
    harness.run({"storage", "sample"});
    EXPECT_THAT(harness.output, StartsWith("gold\n"));
}

TEST(Tool, FormatIsChosenByOptionBeforeVariableBeforeCommand) {
    ListHarness harness;
    harness.environment.values["TOVI_FORMAT"] = "json";
    harness.run({"storage", "sample"});
    EXPECT_THAT(harness.output, StartsWith("["));
    harness.run({"storage", "sample", "--format", "table"});
    EXPECT_THAT(harness.output, StartsWith("Container Name  Max Size\n"));
    harness.environment.values["TOVI_FORMAT"] = "nonsense";
    EXPECT_EQ(harness.run({"storage", "sample"}), 2);
    EXPECT_THAT(harness.errors,
                StartsWith("tovicli: TOVI_FORMAT: unknown format 'nonsense'; there is simple, table, "));
}

TEST(Tool, FormatParametersOfTheUserReplaceTheCommands) {
    ListHarness harness;
    EXPECT_EQ(harness.run({"storage", "sample", "--format-param", "fields:Container=Ready", "--format-param",
                           "header:Container=* %Container Name%"}),
              0);
    EXPECT_EQ(harness.output, "* gold\n  Ready: true\n\n* silver\n  Ready: true\n");
}

TEST(Tool, FieldsChooseInEveryFormatAndMustBeDeclared) {
    ListHarness harness;
    harness.run({"storage", "sample", "--fields", "Ready", "--format=table"});
    EXPECT_EQ(harness.output, "Ready\n-----\ntrue\ntrue\n");
    harness.run({"storage", "sample", "--fields", "Ready", "--format=json"});
    EXPECT_EQ(harness.output, "[\n  {\n    \"Ready\": true\n  },\n  {\n    \"Ready\": true\n  }\n]\n");
    int const before = harness.command->executions;
    EXPECT_EQ(harness.run({"storage", "sample", "--fields", "Size"}), 2);
    EXPECT_EQ(harness.command->executions, before) << "executed although the request cannot be met";
}

TEST(Tool, SettingsReachPluginsThroughTheEnvironment) {
    ToolHarness harness;
    harness.environment.values["TOVI_ROOT"] = "/from-variable";
    harness.run({"storage", "sample"});
    EXPECT_EQ(harness.environment.values["TOVI_ROOT"], "/from-variable");
    EXPECT_EQ(harness.environment.values["TOVI_TIMEOUT_MS"], "30000");
    EXPECT_EQ(harness.environment.values["TOVI_REQUEST_ID"], "request-1");
    EXPECT_FALSE(harness.environment.get("TOVI_LOG_LEVEL").has_value());
    harness.run({"storage", "sample", "--root", "sub", "--timeout=500ms", "--log-level=Info"});
    EXPECT_EQ(harness.environment.values["TOVI_ROOT"], "/cwd/sub");
    EXPECT_EQ(harness.environment.values["TOVI_TIMEOUT_MS"], "500");
    EXPECT_EQ(harness.environment.values["TOVI_LOG_LEVEL"], "info");
    EXPECT_THAT(harness.plugins.roots, ElementsAre("/from-variable", "/cwd/sub"));
}

TEST(Tool, ACommandsOwnOptionHidesTheToolsAndChangesNothing) {
    ToolHarness harness;
    harness.command->parameter("log-level", Plexa::CallSpec::String, "l");
    std::string level;
    harness.command->behaviour = [&level](Input const &input, Output &output) {
        level = input.GetString("log-level");
        output.Complete();
    };
    EXPECT_EQ(harness.run({"storage", "sample", "--log-level", "loud"}), 0);
    EXPECT_EQ(level, "loud");
    EXPECT_EQ(harness.plugins.roots.size(), 1U);
    EXPECT_EQ(harness.run({"--log-level", "trivia", "storage", "sample", "--log-level", "error"}), 0);
    EXPECT_EQ(level, "error");
    EXPECT_EQ(harness.environment.values["TOVI_LOG_LEVEL"], "trivia");
}

TEST(Tool, AValueThatLooksLikeAGlobalOptionIsAValue) {
    ToolHarness harness;
    harness.command->parameter("name", Plexa::CallSpec::String);
    std::string name;
    harness.command->behaviour = [&name](Input const &input, Output &output) {
        name = input.GetString("name");
        output.Complete();
    };
    EXPECT_EQ(harness.run({"storage", "sample", "--name", "--root=/x"}), 0);
    EXPECT_EQ(name, "--root=/x");
    EXPECT_EQ(harness.environment.values["TOVI_ROOT"], "/var/lib/tovi");
    EXPECT_THAT(harness.plugins.roots, ElementsAre("/x", "/var/lib/tovi")); // registered again under the right one
    EXPECT_EQ(harness.run({"storage", "sample", "--name", "--help"}), 0);
    EXPECT_EQ(name, "--help");
}

TEST(Tool, NamespacesListWhatTheyHold) {
    ToolHarness harness;
    harness.command->SetDescription("Sample command.");
    for (std::vector<std::string> const &words :
         std::vector<std::vector<std::string>>{{"storage"}, {"storage", "--help"}, {"-h", "storage"}}) {
        EXPECT_EQ(harness.run(words), 0);
        EXPECT_THAT(harness.output, HasSubstr("Storage commands.\n\nCommands:\n  sample  Sample command.\n"));
    }
    EXPECT_EQ(harness.run({}), 0);
    EXPECT_THAT(harness.output, HasSubstr("Namespaces:\n  storage  Storage commands.\n"));
    EXPECT_THAT(harness.output, HasSubstr("Global options:\n"));
}

TEST(Tool, HelpOfACommandDoesNotRunIt) {
    ToolHarness harness;
    harness.command->parameter("name", Plexa::CallSpec::String, "n", "Its name.")->SetRequired(true);
    EXPECT_EQ(harness.run({"storage", "sample", "--help"}), 0);
    EXPECT_THAT(harness.output, StartsWith("Usage:\n  tovicli storage sample --name TEXT\n"));
    EXPECT_EQ(harness.command->executions, 0);
}

TEST(Tool, fault_14_AMissingCommandIsUnavailableWhenAPluginFailed) {
    ToolHarness harness;
    harness.plugins.registration.troubles = {"plug-in 'a.so' failed: no more\x1b"};
    EXPECT_EQ(harness.run({"storage", "other"}), 3);
    EXPECT_EQ(harness.errors, "tovicli: warning: plug-in 'a.so' failed: no more\\x1b\n"
                              "tovicli: unknown word 'other' in 'storage'; there is sample "
                              "(a plug-in that could not be loaded may hold it)\n");
    EXPECT_EQ(harness.run({"storage", "sample", "--bogus"}), 2);
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    EXPECT_EQ(harness.run({"storage", "sample"}), 0);
    EXPECT_EQ(harness.errors, "tovicli: warning: plug-in 'a.so' failed: no more\\x1b\n");
}

TEST(Tool, fault_58_PrivilegedProcessIgnoresTheEnvironment) {
    ToolHarness harness;
    harness.privileged = true;
    harness.environment.values = {{"TOVI_ROOT", "/evil"},       {"TOVI_PLUGINS", "/evil"}, {"TOVI_FORMAT", "nonsense"},
                                  {"TOVI_TIMEOUT_MS", "x"},     {"TOVI_OFFLINE", "1"},     {"TOVI_LOG_LEVEL", "trivia"},
                                  {"TOVI_REQUEST_ID", "theirs"}};
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    EXPECT_EQ(harness.run({"storage", "sample"}), 0);
    EXPECT_THAT(harness.plugins.directories, ElementsAre("/plugins"));
    EXPECT_THAT(harness.plugins.roots, ElementsAre("/var/lib/tovi"));
    EXPECT_FALSE(harness.environment.get("TOVI_OFFLINE").has_value());
    EXPECT_FALSE(harness.environment.get("TOVI_LOG_LEVEL").has_value());
    EXPECT_EQ(harness.environment.values["TOVI_REQUEST_ID"], "request-1");
    EXPECT_EQ(harness.run({"--plugins=/evil", "storage", "sample"}), 2);
    EXPECT_EQ(harness.run({"storage", "sample", "--root=/evil"}), 2);
    EXPECT_THAT(harness.plugins.directories, ElementsAre("/plugins", "/plugins"));
}

TEST(Tool, OfflineSetByTheUserStays) {
    ToolHarness harness;
    harness.environment.values["TOVI_OFFLINE"] = "1";
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    EXPECT_EQ(harness.run({"storage", "sample"}), 0);
    EXPECT_EQ(harness.environment.values["TOVI_OFFLINE"], "1");
}

} // namespace
