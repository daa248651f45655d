// SPDX-License-Identifier: Apache-2.0
//
// The ground of every contract test: one command, one call, doubles on the far side. At the end of each test nothing
// may be left over but what the test has said must be left.
#pragma once

#include <string>
#include <vector>

#include <boost/make_shared.hpp>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "doubles/KestrelDouble.h"
#include "doubles/LumoDouble.h"
#include "doubles/RecordingCall.h"
#include "kestrel/Lib.h"

namespace PluginTest {

using Doubles::Container;
using Doubles::FileSystemScript;
using Doubles::gantryFailure;
using Doubles::Text;
using Doubles::Unexpected;
using testing::ElementsAre;
using testing::IsEmpty;

/// What a call may leave behind: zero for most commands.
struct LeftOver {
    int openSessions = 0;
    int hosts = 0;
    int fileSystems = 0;
    int results = 0;
};

/// Expects the call to fail because no daemon session can be opened, at the unit and line given.
template <class Call>
void expectNoSession(Call const &call, std::string const &unit, unsigned line) {
    try {
        call();
        FAIL() << "nothing was thrown";
    } catch (Kestrel::Lib::KestrelException const &failure) {
        EXPECT_EQ(failure.GetMessage(), "Unable to initialize lumoLib");
        EXPECT_EQ(failure.GetFile(), "apps/tovicli/plugins/lumo/internal/" + unit);
        EXPECT_EQ(failure.GetLine(), line);
    }
}

class CommandTest : public testing::Test {
protected:
    CommandTest()
        : input(boost::make_shared<Doubles::RecordingInput>(log))
        , output(boost::make_shared<Doubles::RecordingOutput>(log)) {}

    /// Makes the command and calls it once; the log then holds that call alone, and the command is gone.
    template <class Command>
    void run() {
        auto const command = Command::New();
        log.clear();
        command->ExecuteInternal(input, output);
        ranCalls = log.lines();
    }
    /// Fresh arguments and a fresh output, for a further call.
    void renewCall() {
        input = boost::make_shared<Doubles::RecordingInput>(log);
        output = boost::make_shared<Doubles::RecordingOutput>(log);
    }
    /// The lines of the call that begin so.
    std::vector<std::string> callsOf(std::string const &prefix) const {
        return log.linesOf(prefix);
    }
    /// What the call left as result, rendered; "none" without one.
    std::string result() const {
        return Doubles::render(output->GetResult());
    }
    void expectMessageAlone(std::string const &text) const {
        EXPECT_TRUE(output->HasMessage());
        EXPECT_EQ(output->GetMessage(), text);
        EXPECT_EQ(result(), "none");
        EXPECT_FALSE(output->IsComplete());
    }
    void expectResultAlone(std::string const &rendered) const {
        EXPECT_FALSE(output->HasMessage()) << output->GetMessage();
        EXPECT_EQ(result(), rendered);
        EXPECT_TRUE(output->IsComplete());
    }
    /// What a call leaves when completing the output failed: the result that was set before, and the message.
    void expectMessageBehindResult(std::string const &text, std::string const &rendered) const {
        EXPECT_EQ(output->GetMessage(), text);
        EXPECT_EQ(result(), rendered);
        EXPECT_FALSE(output->IsComplete());
    }
    void TearDown() override {
        EXPECT_EQ(lumo.openSessions, leftOver.openSessions) << "open sessions";
        EXPECT_EQ(kestrel.liveHosts, leftOver.hosts) << "host interfaces";
        EXPECT_EQ(kestrel.liveFileSystems, leftOver.fileSystems) << "file systems";
        EXPECT_EQ(lumo.unreleased.total(), leftOver.results) << "daemon results";
    }

    Doubles::CallLog log;
    Doubles::LumoDouble lumo{log};
    Doubles::KestrelDouble kestrel{log};
    boost::shared_ptr<Doubles::RecordingInput> input;
    boost::shared_ptr<Doubles::RecordingOutput> output;
    LeftOver leftOver;
    /// The lines of the call alone, without those of the command's end.
    std::vector<std::string> ranCalls;
};

} // namespace PluginTest
