// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "TemporaryDirectory.h"
#include "shell/LineCompleter.h"

namespace {

using namespace Tovicli::Cli;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Asked {
    std::vector<std::string> words;
    std::string current;
};

LineCompletion completed(std::string const &line, Answer const &answer, Asked *asked = nullptr) {
    return lineCompletion(line, [&](std::vector<std::string> const &words, std::string const &current) {
        if (asked != nullptr) {
            *asked = {words, current};
        }
        return answer;
    });
}

TEST(LineCompletion, TheOnlyValueReplacesTheWordAndABlankFollows) {
    LineCompletion const completion = completed("storage int", {"words", {{"internal", ""}}});
    EXPECT_EQ(completion.replacement, "internal ");
    EXPECT_EQ(completion.replaced, 3U);
    EXPECT_THAT(completion.choices, IsEmpty());
}

TEST(LineCompletion, WhatSeveralHaveInCommonIsTypedFirstThenTheyAreShown) {
    Answer const answer{"words", {{"array-north", "North"}, {"array-south", ""}}};
    EXPECT_EQ(completed("x --arrayid a", answer).replacement, "array-");
    LineCompletion const shown = completed("x --arrayid array-", answer);
    EXPECT_EQ(shown.replacement, "");
    EXPECT_THAT(shown.choices, ElementsAre("  array-north  North", "  array-south"));
}

TEST(LineCompletion, AValueIsQuotedWhereItHasToBe) {
    LineCompletion const completion = completed("x --name 'a", {"words", {{"a b", ""}}});
    EXPECT_EQ(completion.replacement, "'a b' ");
    EXPECT_EQ(completion.replaced, 2U);
}

TEST(LineCompletion, CharactersAreReplacedNotBytes) {
    EXPECT_EQ(completed("x größ", {"words", {{"größe", ""}}}).replaced, 4U);
}

TEST(LineCompletion, AValueBehindAnEqualsSignKeepsItsOption) {
    EXPECT_EQ(completed("x --name=a", {"words", {{"ab", ""}}}).replacement, "--name=ab ");
}

TEST(LineCompletion, TheProgramsNameIsNotAWordOfThePath) {
    Asked asked;
    completed("tovicli storage in", {"words", {}}, &asked);
    EXPECT_THAT(asked.words, ElementsAre("storage"));
    EXPECT_EQ(asked.current, "in");
}

TEST(LineCompletion, PathsAreLookedUpHere) {
    TemporaryDirectory directory;
    std::filesystem::create_directory(directory / "inner");
    writeFile(directory / "inside", "");
    EXPECT_EQ(completed("--root " + directory.path() + "/in", {"directories", {}}).replacement,
              directory.path() + "/inner/");
    EXPECT_EQ(completed("--file " + directory.path() + "/insi", {"files", {}}).replacement,
              directory.path() + "/inside ");
    EXPECT_THAT(completed("--file " + directory.path() + "/in", {"files", {}}).choices,
                ElementsAre("  " + directory.path() + "/inner/", "  " + directory.path() + "/inside"));
}

} // namespace
