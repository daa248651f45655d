// SPDX-License-Identifier: Apache-2.0
#include "lumolib/Progress.h"

#include <string>

#include <gtest/gtest.h>

namespace LumoTest {

/// "3 of 10", "none" when nothing is counted.
std::string counted() {
    std::uint64_t done = 77;
    std::uint64_t total = 77;
    if (!LumoPlatform_Progress(&done, &total)) {
        EXPECT_EQ(done, 77U);
        EXPECT_EQ(total, 77U);
        return "none";
    }
    return std::to_string(done) + " of " + std::to_string(total);
}

class Progress : public ::testing::Test {
protected:
    Progress() {
        LumoPlatform_NoteProgress(0, 0); // other tests count too
    }
};

TEST_F(Progress, is_none_after_a_clear) {
    EXPECT_EQ(counted(), "none");
    LumoPlatform_NoteProgress(3, 10);
    EXPECT_EQ(counted(), "3 of 10");
    LumoPlatform_NoteProgress(0, 0);
    EXPECT_EQ(counted(), "none");
    EXPECT_FALSE(LumoPlatform_Progress(nullptr, nullptr));
}

TEST_F(Progress, counts_one_by_one_where_a_total_is_known) {
    LumoPlatform_NoteOneDone();
    EXPECT_EQ(counted(), "none");
    LumoPlatform_NoteProgress(0, 2);
    LumoPlatform_NoteOneDone();
    EXPECT_EQ(counted(), "1 of 2");
}

TEST_F(Progress, what_was_done_before_need_not_be_done) {
    LumoPlatform_NoteNotNeeded(5);
    EXPECT_EQ(counted(), "none");
    LumoPlatform_NoteProgress(0, 10);
    LumoPlatform_NoteNotNeeded(4);
    EXPECT_EQ(counted(), "0 of 6");
    LumoPlatform_NoteNotNeeded(6);
    EXPECT_EQ(counted(), "0 of 6");
}

TEST_F(Progress, a_total_that_was_too_small_is_none) {
    LumoPlatform_NoteProgress(0, 1);
    LumoPlatform_NoteOneDone();
    LumoPlatform_NoteOneDone();
    EXPECT_EQ(counted(), "2 of 0");
}

} // namespace LumoTest
