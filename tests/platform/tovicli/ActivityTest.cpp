// SPDX-License-Identifier: Apache-2.0
//
// What somebody who watches a run is told, and in which order.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "FixedText.h"
#include "ToolHarness.h"

namespace {

using Plexa::CallSpec::Input;
using Plexa::CallSpec::Output;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct RecordingActivity : Tovicli::Activity {
    void begin(Work const &newWork) override {
        events.push_back("begin");
        work = newWork;
    }
    void end() override {
        events.push_back("end");
    }
    std::vector<std::string> events;
    Work work;
};

/// Tells when the result is written.
struct EventSink : Plexa::Sink {
    explicit EventSink(std::vector<std::string> &to)
        : events(to) {}
    void write(std::string_view) override {
        if (events.empty() || events.back() != "output") {
            events.push_back("output");
        }
    }
    std::vector<std::string> &events;
};

struct WatchedHarness : ToolHarness {
    WatchedHarness() {
        activity = &watcher;
        plugins.progress = [](uint64_t *, uint64_t *) { return false; };
        command->output->SetOutputType(Plexa::MetaObj::MetaBool::New());
        command->behaviour = [this](Input const &, Output &left) {
            watcher.events.push_back("command");
            left.SetResult(Plexa::MetaObj::MetaBool::New(true));
            left.Complete();
        };
    }
    RecordingActivity watcher;
};

TEST(Activity, SpansTheCommandAndEndsBeforeTheResult) {
    WatchedHarness harness;
    EventSink sink(harness.watcher.events);
    EXPECT_EQ(harness.runInto(sink, {"tovicli", "storage", "sample"}), 0);
    EXPECT_THAT(harness.watcher.events, ElementsAre("begin", "command", "end", "output"));
    EXPECT_EQ(harness.watcher.work.progress, harness.plugins.progress);
    EXPECT_TRUE(harness.watcher.work.mayShow);
    EXPECT_FALSE(harness.watcher.work.machine);
    EXPECT_EQ(harness.watcher.work.requestId, "request-1");
}

TEST(Activity, EndsAlsoWhenTheCommandThrows) {
    WatchedHarness harness;
    harness.command->behaviour = [](Input const &, Output &) { throw 7; };
    EXPECT_EQ(harness.run({"storage", "sample"}), 1);
    EXPECT_THAT(harness.watcher.events, ElementsAre("begin", "end"));
}

TEST(Activity, DoesNotSpanHelpVersionAndMistakes) {
    WatchedHarness harness;
    harness.run({"storage"});
    harness.run({"storage", "sample", "--help"});
    harness.run({"--version"});
    harness.run({"storage", "sample", "--bogus"});
    EXPECT_THAT(harness.watcher.events, IsEmpty());
}

TEST(Activity, IsNotShownBesideATraceOrAConversation) {
    WatchedHarness harness;
    harness.run({"storage", "sample", "--log-level=trivia"});
    EXPECT_FALSE(harness.watcher.work.mayShow);
    harness.command->SetMetaDataField("interactive", "true");
    harness.run({"storage", "sample", "--format=json"});
    EXPECT_FALSE(harness.watcher.work.mayShow);
    EXPECT_TRUE(harness.watcher.work.machine);
}

TEST(FixedText, KeepsWhatFits) {
    Tovicli::FixedText text;
    text << "a " << uint64_t{0} << " " << UINT64_MAX;
    EXPECT_EQ(text.text(), "a 0 18446744073709551615");
    text.cut(3);
    EXPECT_EQ(text.text(), "a 0");
    text << std::string(2000, 'x');
    EXPECT_EQ(text.text().size(), 512U);
    text << "more";
    EXPECT_EQ(text.text().size(), 512U);
}

} // namespace
