// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "plexa/UsageError.h"
#include "shell/Words.h"

namespace {

using namespace Tovicli::Cli;
using ::testing::HasSubstr;
using Words = std::vector<std::string>;

struct Example {
    char const *line;
    Words words;
};

TEST(Words, AreSplitAsAPosixShellSplitsThem) {
    for (Example const &example : std::vector<Example>{
             {"", {}},
             {"  \t ", {}},
             {"a b", {"a", "b"}},
             {" a\tb ", {"a", "b"}},
             {"'a b' \"c d\"", {"a b", "c d"}},
             {"a'b'\"c\"d", {"abcd"}},
             {"''", {""}},
             {"--name=\"\"", {"--name="}},
             {R"(a\ b)", {"a b"}},
             {R"(\'a\")", {"'a\""}},
             {R"('a\b')", {"a\\b"}},
             {R"("a\b\"\\\$\`")", {"a\\b\"\\$`"}},
             {"a # b", {"a"}},
             {"#a", {}},
             {"a#b", {"a#b"}},
             {"'#' \\#", {"#", "#"}},
             {"* ? ~ [a] {b} !", {"*", "?", "~", "[a]", "{b}", "!"}},
             {R"('$x' \$x '|')", {"$x", "$x", "|"}},
             {"größe 'ü ß'", {"größe", "ü ß"}},
         }) {
        EXPECT_EQ(splitWords(example.line), example.words) << example.line;
    }
}

TEST(Words, WhatOnlyAShellDoesIsRefused) {
    for (auto const &[line, part] : std::vector<std::pair<char const *, char const *>>{{"a | b", "'|'"},
                                                                                       {"a&", "'&'"},
                                                                                       {"a;b", "';'"},
                                                                                       {"a > b", "'>'"},
                                                                                       {"a < b", "'<'"},
                                                                                       {"(a)", "'('"},
                                                                                       {"$a", "'$'"},
                                                                                       {"\"$a\"", "'$'"},
                                                                                       {"`a`", "'`'"},
                                                                                       {"'a", "a ' is not"},
                                                                                       {"\"a", "a \" is not"},
                                                                                       {"a\\", "backslash"},
                                                                                       {"\"a\\\"", "not closed"}}) {
        try {
            splitWords(line);
            ADD_FAILURE() << line << " was taken";
        } catch (Plexa::UsageError const &mistake) {
            EXPECT_THAT(mistake.sentence(), HasSubstr(part)) << line;
        }
    }
}

TEST(Words, QuotingIsUndoneBySplitting) {
    for (std::string const &word :
         Words{"", "a", "a b", "it's", "\"", "\\", "$x", "#", "*", "größe", "a\tb", "--x=y"}) {
        EXPECT_EQ(splitWords(quotedWord(word)), Words{word});
    }
    EXPECT_EQ(quotedWord("file:///a/b.array"), "file:///a/b.array");
}

TEST(Words, AnUnfinishedLineIsTakenAsFarAsItGoes) {
    for (auto const &[line, words, current, begin] :
         std::vector<std::tuple<char const *, Words, char const *, std::size_t>>{
             {"", {}, "", 0},
             {"a", {}, "a", 0},
             {"a ", {"a"}, "", 2},
             {"a 'b c", {"a"}, "b c", 2},
             {"a \"b c", {"a"}, "b c", 2},
             {"a b\\", {"a"}, "b", 2},
             {"a $b | #c", {"a", "$b", "|"}, "#c", 7},
         }) {
        Unfinished const unfinished = splitUnfinished(line);
        EXPECT_EQ(unfinished.words, words) << line;
        EXPECT_EQ(unfinished.current, current) << line;
        EXPECT_EQ(unfinished.begin, begin) << line;
    }
}

} // namespace
