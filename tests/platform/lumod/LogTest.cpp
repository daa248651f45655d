// SPDX-License-Identifier: Apache-2.0
#include "lumod/Log.h"

#include <gtest/gtest.h>

#include "Escape.h"
#include "Fixture.h"

namespace {

using Lumod::LogLevel;
using LumodTest::MemorySink;

std::chrono::system_clock::time_point at(int64_t milliseconds) {
    return std::chrono::system_clock::time_point(std::chrono::milliseconds(milliseconds));
}

TEST(Log, ALineHoldsTimeLevelTraceAndText) {
    MemorySink sink;
    Lumod::Log log(sink, LogLevel::Info, [] { return at(1'000'000'000'123); });
    log.write(LogLevel::Warning, "cmd-7", "hello");
    log.write(LogLevel::Info, "", "nobody's");
    EXPECT_EQ(sink.text, "2001-09-09T01:46:40.123Z warning cmd-7 hello\n2001-09-09T01:46:40.123Z info - nobody's\n");
}

TEST(Log, WritesWhatItsLevelShows) {
    struct Case {
        LogLevel level;
        char const *shown;
    };
    Case const cases[] = {{LogLevel::Quiet, ""},       {LogLevel::Panic, "P"},   {LogLevel::Error, "PE"},
                          {LogLevel::Warning, "PEW"},  {LogLevel::Info, "PEWI"}, {LogLevel::Verbose, "PEWIV"},
                          {LogLevel::Trivia, "PEWIVT"}};
    for (Case const &each : cases) {
        MemorySink sink;
        Lumod::Log log(sink, each.level);
        std::string shown;
        for (auto const &[level, letter] :
             {std::pair{LogLevel::Panic, 'P'}, std::pair{LogLevel::Error, 'E'}, std::pair{LogLevel::Warning, 'W'},
              std::pair{LogLevel::Info, 'I'}, std::pair{LogLevel::Verbose, 'V'}, std::pair{LogLevel::Trivia, 'T'}}) {
            sink.text.clear();
            log.write(level, "t", "x");
            if (!sink.text.empty()) {
                shown += letter;
            }
        }
        EXPECT_EQ(shown, each.shown) << Lumod::nameOf(each.level);
    }
}

TEST(Log, WriteAlwaysIsWrittenAtEveryLevel) {
    MemorySink sink;
    Lumod::Log log(sink, LogLevel::Quiet);
    log.writeAlways("t", "x");
    EXPECT_TRUE(sink.holds("t x\n"));
}

TEST(Log, LevelsAreTheNumbersThatCommandsSend) {
    for (int64_t const number : {1, 2, 4, 8, 16, 32, 64}) {
        ASSERT_TRUE(Lumod::logLevelOf(number).has_value()) << number;
        EXPECT_EQ(static_cast<int64_t>(*Lumod::logLevelOf(number)), number);
    }
    for (int64_t const number : {0, 3, 5, 128, -1}) {
        EXPECT_FALSE(Lumod::logLevelOf(number).has_value()) << number;
    }
}

TEST(Log, HostileTextsStayOnTheirLine) {
    MemorySink sink;
    Lumod::Log log(sink, LogLevel::Info, [] { return at(0); });
    log.write(LogLevel::Info, "a\nb", "x\r\n\x1b[31m\xff\xe2\x80\xae y\\z \xc3\xa4");
    EXPECT_EQ(sink.text,
              "1970-01-01T00:00:00.000Z info a\\x0Ab x\\x0D\\x0A\\x1B[31m\\xFF\\xE2\\x80\\xAE y\\\\z \xc3\xa4\n");
}

TEST(Log, ALongTraceIsCut) {
    MemorySink sink;
    Lumod::Log log(sink, LogLevel::Info);
    log.write(LogLevel::Info, std::string(5000, 't'), "x");
    EXPECT_LT(sink.text.size(), 200U);
}

TEST(Escape, fault_64_KeepsASentenceOnOneLine) {
    EXPECT_EQ(Lumod::onOneLine("the volume 'a\nb\r\tc' \\ \x1b"), "the volume 'a\\nb\\r\\tc' \\ \x1b");
}

TEST(Escape, TellsUtf8FromOtherBytes) {
    for (char const *good : {"", "plain", "\xc3\xa4", "\xe2\x82\xac", "\xf0\x9f\x98\x80", "\xf4\x8f\xbf\xbf"}) {
        EXPECT_TRUE(Lumod::isUtf8(good)) << good;
    }
    for (char const *bad :
         {"\x80", "\xc3", "\xc0\xaf", "\xed\xa0\x80", "\xf4\x90\x80\x80", "\xe0\x80\xaf", "\xff", "a\xe2\x82"}) {
        EXPECT_FALSE(Lumod::isUtf8(bad)) << bad;
    }
}

TEST(Escape, RepairsWhatIsNoUtf8) {
    EXPECT_EQ(Lumod::repaired("a\xff"
                              "b\xc3\xa4"),
              "a\xef\xbf\xbd"
              "b\xc3\xa4");
}

} // namespace
