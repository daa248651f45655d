// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "plexa/OptionTable.h"
#include "plexa/Text.h"

namespace {

using namespace Plexa;

struct EscapeCase {
    std::string text;
    std::string shown;
};

TEST(Text, EveryByteAtEveryPlaceIsPlainOrNot) {
    for (std::size_t size = 0; size <= 25; ++size) {
        std::string text(size, ' ');
        EXPECT_TRUE(Plexa::isPlainAscii(text));
        for (char &place : text) {
            for (int code = 0; code < 256; ++code) {
                place = static_cast<char>(code);
                bool const printing = code >= ' ' && code < 0x7F;
                ASSERT_EQ(Plexa::isPlainAscii(text), printing) << code << " of " << size;
                ASSERT_EQ((Plexa::isPlainAsciiBut<'"', '\\'>(text)), printing && code != '"' && code != '\\') << code;
            }
            place = '~';
        }
    }
}

TEST(Text, EscapesWhatActsOrHides) {
    EscapeCase const cases[] = {
        {"plain \\ text", "plain \\ text"},  {"\n\r\t", "\\n\\r\\t"}, {"\x1b[31m", "\\x1b[31m"},
        {std::string("a\0b", 3), "a\\x00b"}, {"\x7f", "\\x7f"},       {"\xC2\x9B", "\\u009b"}, // CSI as one character
        {"\xE2\x80\xAE", "\\u202e"},                                                           // right-to-left override
        {"\xE2\x81\xA6", "\\u2066"},                                                           // isolate
        {"\xE2\x80\x8B", "\\u200b"},                                                           // zero width space
        {"\xEF\xBB\xBF", "\\ufeff"},                                                           // byte order mark
        {"\xE2\x80\xA8", "\\u2028"},                                                           // line separator
        {"\xF3\xA0\x81\x81", "\\U000e0041"},                                                   // tag
        {"\xff\xfe", "\\xff\\xfe"},                                                            // never in UTF-8
        {"\xC0\x80", "\\xc0\\x80"},                                                            // overlong
        {"\xED\xA0\x80", "\\xed\\xa0\\x80"},                                                   // surrogate
        {"\xE2\x82", "\\xe2\\x82"},                                                            // cut short
        {"Größe 金 😀", "Größe 金 😀"},
    };
    for (EscapeCase const &each : cases) {
        EXPECT_EQ(escaped(each.text), each.shown);
        EXPECT_TRUE(isValidUtf8(escaped(each.text)));
    }
}

TEST(Text, KeepsLineEndsAndTabsOnRequestOnly) {
    EXPECT_EQ(escaped("a\n\tb\r\x1b", Lines::Keep), "a\n\tb\\r\\x1b");
}

TEST(Text, KnowsValidUtf8) {
    EXPECT_TRUE(isValidUtf8(""));
    EXPECT_TRUE(isValidUtf8("Größe"));
    EXPECT_FALSE(isValidUtf8("ab\xff"));
    EXPECT_FALSE(isValidUtf8("\xF4\x90\x80\x80")); // past the last code point
}

TEST(Text, WidthCountsColumns) {
    EXPECT_EQ(displayWidth("abc"), 3U);
    EXPECT_EQ(displayWidth("金額"), 4U);
    EXPECT_EQ(displayWidth("e\xCC\x81"), 1U);
    EXPECT_EQ(displayWidth(""), 0U);
}

TEST(Text, WrapsAtBlanksAndKeepsTheOnesInside) {
    EXPECT_EQ(wrapped("to  set LogLevel now", 12), (std::vector<std::string>{"to  set", "LogLevel now"}));
    EXPECT_EQ(wrapped("extraordinarily long", 5), (std::vector<std::string>{"extraordinarily", "long"}));
    EXPECT_EQ(wrapped("first\nsecond", 40), (std::vector<std::string>{"first", "second"}));
    EXPECT_EQ(wrapped("", 40), (std::vector<std::string>{""}));
}

TEST(Text, OptionTableAlignsAndWrapsDescriptions) {
    std::string table;
    appendOptionTable(
        table, {{"add", "Adds one to the others."}, {"remove", ""}, {std::string(40, 'x'), "Below its name."}}, 30);
    EXPECT_EQ(table, "  add     Adds one to the\n"
                     "          others.\n"
                     "  remove\n"
                     "  xxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxx\n"
                     "          Below its name.\n");
}

TEST(Text, KeywordsAreEqualWithoutRegardToTheCaseOfAsciiLetters) {
    EXPECT_TRUE(equalIgnoringCase("Trivia", "tRIVIA"));
    EXPECT_TRUE(equalIgnoringCase("", ""));
    EXPECT_FALSE(equalIgnoringCase("true", "truer"));
    EXPECT_FALSE(equalIgnoringCase("[", "{"));               // one bit apart, as letters are
    EXPECT_FALSE(equalIgnoringCase("\xC3\x84", "\xC3\xA4")); // no letters of ASCII
}

} // namespace
