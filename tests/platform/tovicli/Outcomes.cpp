// SPDX-License-Identifier: Apache-2.0
//
// What a command leaves, and what the user gets: exit status, standard output, standard error.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "ToolHarness.h"
#include "gantry/Lib.h"
#include "kestrel/Lib.h"

namespace {

using Plexa::CallSpec::Input;
using Plexa::CallSpec::Output;
using Plexa::MetaObj::MetaBool;
using Plexa::MetaObj::MetaString;
using ::testing::EndsWith;
using ::testing::StartsWith;
using Tovicli::LastFailure;

struct Case {
    std::string name;
    std::function<void(Output &)> behaviour;
    std::optional<LastFailure> failure;
    int status;
    std::string output;
    std::string errors;
};

Case const cases[] = {
    {"a completed result",
     [](Output &output) {
         output.SetResult(MetaBool::New(true));
         output.Complete();
     },
     {},
     0,
     "true\n",
     ""},
    {"completed without result", [](Output &output) { output.Complete(); }, {}, 0, "", ""},
    {"a message", [](Output &output) { output.SetMessage("Not found.\n"); }, {}, 1, "", "tovicli: Not found.\n"},
    {"a message without line end", [](Output &output) { output.SetMessage("No"); }, {}, 1, "", "tovicli: No\n"},
    {"a message of two lines", [](Output &output) { output.SetMessage("a\nb\n\n"); }, {}, 1, "", "tovicli: a\nb\n\n"},
    {"a message with a control character",
     [](Output &output) { output.SetMessage("a\x1b[2J"); },
     {},
     1,
     "",
     "tovicli: a\\x1b[2J\n"},
    {"a message beside a completed output",
     [](Output &output) {
         output.SetMessage("LumoLib_DebugCommand  failed with error the request is invalid\n");
         output.Complete();
     },
     LastFailure{1, "the level 3 is none", "r"}, 1, "",
     "tovicli: LumoLib_DebugCommand  failed with error the request is invalid: the level 3 is none\n"},
    {"a message that holds its cause", [](Output &output) { output.SetMessage("Failed: no such array"); },
     LastFailure{22, "no such array", "r"}, 1, "", "tovicli: Failed: no such array\n"},
    {"a result with a message",
     [](Output &output) {
         output.SetResult(MetaString::New("half"));
         output.SetMessage("the rest failed");
     },
     {},
     1,
     "half\n",
     "tovicli: the rest failed\n"},
    {"an output left incomplete",
     [](Output &output) { output.SetResult(MetaBool::New(true)); },
     {},
     1,
     "true\n",
     "tovicli: the command ended without completing its output\n"},
    {"nothing at all", [](Output &) {}, {}, 1, "", "tovicli: the command ended without completing its output\n"},
    {"a false result",
     [](Output &output) {
         output.SetResult(MetaBool::New(false));
         output.Complete();
     },
     LastFailure{63, "the rule exists", "r"}, 1, "false\n",
     "tovicli: the command reported failure: the rule exists ('faultInjection rule set' changes a rule)\n"},
    {"a failure that the command could do without",
     [](Output &output) {
         output.SetResult(MetaBool::New(true));
         output.Complete();
     },
     LastFailure{30, "the provider cannot be reached", "r"}, 0, "true\n",
     "tovicli: warning: the provider cannot be reached\n"},
    {"a host's exception",
     [](Output &) { throw Gantry::Lib::GantryException("no such container", {}); },
     {},
     1,
     "",
     "tovicli: no such container\n"},
    {"a failed session",
     [](Output &) { throw Kestrel::Lib::KestrelException("Unable to initialize lumoLib", "f", 1, {}); },
     {},
     3,
     "",
     "tovicli: Unable to initialize lumoLib\n"},
    {"a failed session, the daemon dead",
     [](Output &) { throw Kestrel::Lib::KestrelException("Unable to initialize lumoLib", "f", 1, {}); },
     LastFailure{10, "no daemon answers at /r/run/lumod.sock", "r"}, 3, "",
     "tovicli: Unable to initialize lumoLib: no daemon answers at /r/run/lumod.sock (start it with 'lumod --root "
     "/r')\n"},
    {"memory", [](Output &) { throw std::bad_alloc(); }, {}, 1, "", "tovicli: out of memory\n"},
    {"any other exception", [](Output &) { throw std::runtime_error("what"); }, {}, 1, "", "tovicli: what\n"},
    {"no exception of the library's",
     [](Output &) { throw 7; },
     {},
     1,
     "",
     "tovicli: the command failed with an exception of an unknown kind\n"},
    {"the connection lost", [](Output &output) { output.SetMessage("m\n"); }, LastFailure{11, "cut", ""}, 3, "",
     "tovicli: m: cut (see /r/log/lumod.log, request request-1)\n"},
    {"the deadline passed", [](Output &output) { output.SetMessage("m\n"); }, LastFailure{12, "late", ""}, 3, "",
     "tovicli: m: late (--timeout gives it more time)\n"},
    {"no session", [](Output &output) { output.SetMessage("m\n"); }, LastFailure{14, "none", ""}, 3, "",
     "tovicli: m: none\n"},
    {"a provider away", [](Output &output) { output.SetMessage("m\n"); }, LastFailure{30, "away", ""}, 1, "",
     "tovicli: m: away (see /r/log/lumod.log, request request-1)\n"},
    {"a host's exception for a dead daemon", [](Output &) { throw Gantry::Lib::GantryException("cannot mount", {}); },
     LastFailure{10, "no daemon answers at /r/run/lumod.sock", ""}, 3, "",
     "tovicli: cannot mount: no daemon answers at /r/run/lumod.sock (start it with 'lumod --root /r')\n"},
};

TEST(Outcomes, DecideStatusAndTexts) {
    for (Case const &each : cases) {
        ToolHarness harness;
        harness.command->behaviour = [&](Input const &, Output &output) {
            harness.plugins.failure = each.failure;
            each.behaviour(output);
        };
        EXPECT_EQ(harness.run({"--root", "/r", "storage", "sample"}), each.status) << each.name;
        EXPECT_EQ(harness.output, each.output) << each.name;
        EXPECT_EQ(harness.errors, each.errors) << each.name;
    }
}

TEST(Outcomes, AFailureBeforeTheCallIsNotItsCause) {
    ToolHarness harness;
    harness.plugins.failure = LastFailure{10, "from the registration", ""};
    harness.command->behaviour = [](Input const &, Output &output) { output.SetMessage("own"); };
    EXPECT_EQ(harness.run({"storage", "sample"}), 1);
    EXPECT_EQ(harness.errors, "tovicli: own\n");
}

TEST(Outcomes, RequestIdIsShownWhenMuchIsTold) {
    for (std::string const level : {"verbose", "info"}) {
        ToolHarness harness;
        harness.command->behaviour = [&](Input const &, Output &output) {
            harness.plugins.failure = LastFailure{22, "no such array", "request-1"};
            output.SetMessage("failed");
        };
        harness.run({"--log-level", level, "storage", "sample"});
        std::string const id = level == "info" ? "" : " [request request-1]";
        EXPECT_EQ(harness.errors, "tovicli: failed: no such array" + id + "\n");
    }
}

TEST(Outcomes, MachineFormatTellsErrorsAsADocument) {
    ToolHarness harness;
    harness.command->behaviour = [&](Input const &, Output &output) {
        harness.plugins.failure = LastFailure{22, "no such array", "request-1"};
        output.SetMessage("failed \"here\"\n");
    };
    EXPECT_EQ(harness.run({"storage", "sample", "--format", "json"}), 1);
    EXPECT_EQ(harness.output, "");
    EXPECT_EQ(harness.errors, "{\"error\":{\"message\":\"failed \\\"here\\\"\",\"cause\":\"no such array\",\"code\":22,"
                              "\"hint\":null,\"requestId\":\"request-1\",\"warnings\":[]}}\n");
    harness.command->behaviour = [](Input const &, Output &output) { output.SetMessage("alone"); };
    harness.run({"--format=json", "storage", "sample"});
    EXPECT_EQ(harness.errors, "{\"error\":{\"message\":\"alone\",\"cause\":null,\"code\":null,\"hint\":null,"
                              "\"requestId\":\"request-1\",\"warnings\":[]}}\n");
}

TEST(Outcomes, MachineFormatTellsMistakesAsADocumentToo) {
    ToolHarness harness;
    for (std::vector<std::string> const &words :
         std::vector<std::vector<std::string>>{{"--format=json", "--bogus"},
                                               {"--bogus", "--format", "json"},
                                               {"--format", "json", "storage", "sample", "--bogus"},
                                               {"--format", "json", "storage", "\xff\"\n"}}) {
        EXPECT_EQ(harness.run(words), 2);
        EXPECT_THAT(harness.errors, StartsWith("{\"error\":{\"message\":\""));
        EXPECT_THAT(harness.errors, EndsWith(",\"warnings\":[]}}\n"));
        EXPECT_EQ(harness.errors.find('\n'), harness.errors.size() - 1) << harness.errors;
    }
    harness.environment.values["TOVI_FORMAT"] = "json";
    EXPECT_EQ(harness.run({"--bogus"}), 2);
    EXPECT_THAT(harness.errors, StartsWith("{\"error\":"));
}

TEST(Outcomes, MachineFormatHasOneDocumentWithItsWarnings) {
    ToolHarness harness;
    harness.plugins.registration.troubles = {"plug-in 'a.so' failed: \"no\"\x1b\xff"};
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    EXPECT_EQ(harness.run({"--format=json", "storage", "sample"}), 0);
    EXPECT_EQ(harness.errors, "{\"warnings\":[\"plug-in 'a.so' failed: \\\"no\\\"\\u001b\\\\xff\"]}\n");
    harness.command->behaviour = [](Input const &, Output &output) { output.SetMessage("failed"); };
    EXPECT_EQ(harness.run({"--format=json", "storage", "sample"}), 1);
    EXPECT_THAT(harness.errors, StartsWith("{\"error\":{\"message\":\"failed\""));
    EXPECT_THAT(harness.errors, EndsWith("\"warnings\":[\"plug-in 'a.so' failed: \\\"no\\\"\\u001b\\\\xff\"]}}\n"));
}

TEST(Outcomes, HintsNameWhatCanBeDone) {
    struct Hinted {
        int32_t code;
        std::string hint;
    };
    for (Hinted const &each : {Hinted{10, "start it with 'lumod --root /r'"},
                               {32, "'orkaprovider activate' makes a provider the array's active one"},
                               {43, "it was left as it is; use the newer release that wrote it"},
                               {45, ""},
                               {9999, ""}}) {
        ToolHarness harness;
        harness.command->behaviour = [&](Input const &, Output &output) {
            harness.plugins.failure = LastFailure{each.code, "why, at /r/run/lumod.sock", ""};
            output.SetMessage("failed.\n\n");
        };
        harness.run({"--root=/r", "storage", "sample"});
        std::string const hint = each.hint.empty() ? "" : " (" + each.hint + ")";
        EXPECT_EQ(harness.errors, "tovicli: failed. why, at /r/run/lumod.sock" + hint + "\n");
    }
}

TEST(Outcomes, fault_33_DaemonAbsentIsOneWarningOrOneLine) {
    ToolHarness harness;
    harness.plugins.registration.daemonMissing = true;
    harness.plugins.registration.daemonFailure = LastFailure{10, "no daemon answers at /r/run/lumod.sock: refused", ""};
    std::string const hint = " (start it with 'lumod --root /r')\n";
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    EXPECT_EQ(harness.run({"--root=/r", "storage", "sample"}), 0);
    EXPECT_EQ(harness.errors, "tovicli: warning: no daemon answers at /r/run/lumod.sock: refused" + hint);

    harness.command->behaviour = [&](Input const &, Output &output) {
        harness.plugins.failure = LastFailure{10, "no daemon answers at /r/run/lumod.sock", ""};
        output.SetMessage("failed with error the daemon is not running\n");
        output.Complete();
    };
    EXPECT_EQ(harness.run({"--root=/r", "storage", "sample"}), 3);
    EXPECT_EQ(harness.errors, "tovicli: failed with error the daemon is not running: no daemon answers at "
                              "/r/run/lumod.sock" +
                                  hint);

    EXPECT_EQ(harness.run({"--root=/r", "storage"}), 0);
    EXPECT_EQ(harness.errors, "tovicli: warning: no daemon answers at /r/run/lumod.sock: refused" + hint);
    EXPECT_EQ(harness.run({"--root=/r", "storage", "sample", "--bogus"}), 2);
    EXPECT_EQ(harness.errors, "tovicli: unknown option '--bogus' (try 'tovicli storage sample --help')\n");
}

TEST(Outcomes, fault_57_ASocketThatMayNotBeUsedIsNoDeadDaemon) {
    ToolHarness harness;
    std::string const why = "the daemon's socket /r/run/lumod.sock may not be used: Permission denied";
    harness.plugins.registration.daemonMissing = true;
    harness.plugins.registration.daemonFailure = LastFailure{6, why, ""};
    harness.command->behaviour = [&](Input const &, Output &output) {
        harness.plugins.failure = LastFailure{10, "no daemon answers at /r/run/lumod.sock", ""}; // said offline
        output.SetMessage("Unable to load");
        output.Complete();
    };
    EXPECT_EQ(harness.run({"--root=/r", "storage", "sample"}), 3);
    EXPECT_EQ(harness.errors, "tovicli: Unable to load: " + why + "\n");
}

TEST(Outcomes, fault_33_WithoutTheCauseTheSocketIsNamedAllTheSame) {
    ToolHarness harness;
    harness.plugins.registration.daemonMissing = true;
    harness.command->behaviour = [](Input const &, Output &output) { output.Complete(); };
    harness.run({"--root=/r", "storage", "sample"});
    EXPECT_EQ(harness.errors,
              "tovicli: warning: no daemon answers at /r/run/lumod.sock (start it with 'lumod --root /r')\n");
}

TEST(Outcomes, fault_63_OutputThatCannotBeWrittenIsToldWithWhatWasDone) {
    ToolHarness harness;
    harness.command->behaviour = [](Input const &, Output &output) {
        output.SetResult(MetaBool::New(true));
        output.Complete();
    };
    FailingSink sink;
    EXPECT_EQ(harness.runInto(sink, {"tovicli", "storage", "sample"}), 4);
    EXPECT_EQ(harness.errors,
              "tovicli: cannot write the output: No space left on device; the command itself was completed\n");
    EXPECT_EQ(harness.command->executions, 1);
    FailingSink forHelp;
    EXPECT_EQ(harness.runInto(forHelp, {"tovicli", "--help"}), 4);
    EXPECT_EQ(harness.errors, "tovicli: cannot write the output: No space left on device\n");
}

/// A value of a kind that no format knows.
class Strange : public Plexa::MetaObj::MetaObject {};

TEST(Outcomes, AResultThatTheFormatCannotHoldIsNoSuccess) {
    ToolHarness harness;
    harness.command->behaviour = [](Input const &, Output &output) {
        output.SetResult(boost::shared_ptr<Plexa::MetaObj::MetaObject>(new Strange));
        output.Complete();
    };
    EXPECT_EQ(harness.run({"--format=yaml", "storage", "sample"}), 4);
    EXPECT_THAT(harness.errors,
                StartsWith("{\"error\":{\"message\":\"the format yaml cannot hold the result: its value is of "
                           "a kind that it does not know; the command itself was completed\""));
    EXPECT_EQ(harness.run({"--format=simple", "storage", "sample"}), 4);
    EXPECT_EQ(harness.output, "");
}

} // namespace
