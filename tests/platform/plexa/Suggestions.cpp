// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "plexa/UsageError.h"

namespace {

using namespace Plexa;

TEST(Suggestions, NearNamesComeNearestFirst) {
    std::vector<std::string> const names = {"add", "set", "remove", "activate", "deactivate", "injectfault"};
    EXPECT_EQ(nearNames("ad", names), (std::vector<std::string>{"add"}));
    EXPECT_EQ(nearNames("remvoe", names), (std::vector<std::string>{"remove"}));
    EXPECT_EQ(nearNames("REMOVE", names), (std::vector<std::string>{"remove"}));
    EXPECT_EQ(nearNames("inject", names), (std::vector<std::string>{"injectfault"}));
    EXPECT_EQ(nearNames("deactivat", names).front(), "deactivate");
    EXPECT_TRUE(nearNames("zebra", names).empty());
    EXPECT_TRUE(nearNames("", names).empty());
    EXPECT_TRUE(nearNames(std::string(100000, 'a'), names).empty());
}

TEST(Suggestions, ReadAsAQuestion) {
    EXPECT_EQ(didYouMean({}), "");
    EXPECT_EQ(didYouMean({"add"}), "; did you mean 'add'?");
    EXPECT_EQ(didYouMean({"add", "set"}), "; did you mean 'add' or 'set'?");
    EXPECT_EQ(didYouMean({"a", "b", "c"}), "; did you mean 'a', 'b' or 'c'?");
}

TEST(Suggestions, QuotedWordsAreEscapedAndCut) {
    EXPECT_EQ(shownWord("a\x1b"), "'a\\x1b'");
    EXPECT_EQ(shownWord(std::string(2000000, 'x')), "'" + std::string(120, 'x') + "...' (2000000 bytes)");
}

} // namespace
