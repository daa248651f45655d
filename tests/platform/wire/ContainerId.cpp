// SPDX-License-Identifier: Apache-2.0
#include "wire/ContainerId.h"

#include <gtest/gtest.h>

namespace {

std::string const canonical = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";

std::string printed(std::string_view text) {
    return Wire::normalizeContainerId(text).value_or("none");
}

TEST(ContainerId, accepts_every_spelling_of_a_uuid) {
    EXPECT_EQ(printed("0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9"), canonical);
    EXPECT_EQ(printed("0A1B2C3D-4E5F-6071-8293-A4B5C6D7E8F9"), canonical);
    EXPECT_EQ(printed("0a1B2c3D-4e5F-6071-8293-a4b5C6d7E8f9"), canonical);
    EXPECT_EQ(printed("0a1b2c3d4e5f60718293a4b5c6d7e8f9"), canonical);
    EXPECT_EQ(printed("{0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9}"), canonical);
    EXPECT_EQ(printed("{0A1B2C3D4E5F60718293A4B5C6D7E8F9}"), canonical);
}

TEST(ContainerId, refuses_what_is_no_uuid) {
    for (std::string_view const text : {
             "",
             "{}",
             "{",
             "0",
             "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f",      // a digit short
             "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f90",    // one too many
             "0a1b2c3d-4e5f-6071-8293a4b5c6d7e8f9",      // some hyphens
             "0a1b2c3-d4e5f-6071-8293-a4b5c6d7e8f9",     // in the wrong place
             "0a1b2c3d04e5f-6071-8293-a4b5c6d7e8f9",     // a digit in a hyphen's place
             "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8fg",     // no digit
             "{0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9",    // one brace
             "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9}",    // the other
             "{{0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9}}", // too many
             " 0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9",    // a blank
             "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9\n",
         }) {
        EXPECT_EQ(printed(text), "none") << text;
    }
}

TEST(ContainerId, refuses_a_nul_among_the_digits) {
    std::string text = canonical;
    text[5] = '\0';
    EXPECT_EQ(printed(text), "none");
}

TEST(ContainerId, leaves_a_canonical_id_as_it_is_when_asked_twice) {
    EXPECT_EQ(printed(printed("{0A1B2C3D4E5F60718293A4B5C6D7E8F9}")), canonical);
}

} // namespace
