// SPDX-License-Identifier: Apache-2.0
#include <cstdint>
#include <set>
#include <string>

#include "wire/Failure.h"

#include <gtest/gtest.h>

namespace {

TEST(ErrorCode, has_a_text_of_its_own_for_every_code) {
    std::set<std::string> texts;
    int known = 0;
    for (std::int32_t code = 0; code < 1000; ++code) {
        if (char const *text = Wire::textOf(code)) {
            ++known;
            texts.insert(text);
            EXPECT_STRNE(text, "") << code;
        }
    }
    EXPECT_EQ(known, 49);
    EXPECT_EQ(texts.size(), 49U);
}

TEST(ErrorCode, has_no_text_for_an_unknown_code) {
    EXPECT_EQ(Wire::textOf(-1), nullptr);
    EXPECT_EQ(Wire::textOf(9), nullptr);
    EXPECT_EQ(Wire::textOf(INT32_MAX), nullptr);
    EXPECT_EQ(Wire::textOf(INT32_MIN), nullptr);
}

TEST(Failure, keeps_code_and_sentence) {
    Wire::Failure const failure(Wire::ErrorCode::InUse, "volume v is in use");
    EXPECT_EQ(failure.code(), Wire::ErrorCode::InUse);
    EXPECT_STREQ(failure.what(), "volume v is in use");
}

} // namespace
