// SPDX-License-Identifier: Apache-2.0
//
// Documents as they are written; reading them is tested by what lying providers answer.
#include "https/BodyWriter.h"

#include <gtest/gtest.h>

#include "https/Messages.h"

namespace {

TEST(Slice, endsByCountBySizeOrWithItsList) {
    std::vector<Orka::ConfigVolume> const volumes(5, Orka::ConfigVolume{"u", "d", std::nullopt});
    auto const slice = [&volumes](std::size_t offset, std::size_t most, std::size_t bytesMost) {
        Orka::Https::BodyWriter writer;
        writer.begin();
        std::size_t const count = writer.slice("items", volumes, offset, most, bytesMost);
        writer.end();
        EXPECT_EQ(writer.take().find("\"items\":["), 1U);
        return count;
    };
    EXPECT_EQ(slice(0, 10, 1000), 5U);
    EXPECT_EQ(slice(3, 10, 1000), 2U);
    EXPECT_EQ(slice(5, 10, 1000), 0U);
    EXPECT_EQ(slice(0, 2, 1000), 2U);
    EXPECT_EQ(slice(0, 10, 1), 1U) << "one, however long";
    EXPECT_EQ(slice(0, 10, 60), 2U);
}

} // namespace
