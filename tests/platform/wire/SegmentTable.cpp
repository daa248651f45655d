// SPDX-License-Identifier: Apache-2.0
#include "wire/SegmentTable.h"

#include <cstring>
#include <string>
#include <vector>

#include "wire/Failure.h"
#include "wire/MessageBuffer.h"

#include <gtest/gtest.h>

namespace {

/// The table of the given numbers, as its bytes; the first number is the count of segments less one.
std::vector<std::uint8_t> table(std::vector<std::uint32_t> numbers) {
    numbers.resize((numbers.size() + 1) / 2 * 2);
    std::vector<std::uint8_t> bytes(4 * numbers.size());
    std::memcpy(bytes.data(), numbers.data(), bytes.size());
    return bytes;
}

/// What becomes of a table: its sizes, or the code and sentence of its refusal.
std::string judged(std::vector<std::uint32_t> const &numbers, std::size_t limit) {
    std::vector<std::uint8_t> const bytes = table(numbers);
    try {
        std::size_t const size = Wire::SegmentTable::bytesOf(bytes.data());
        if (size > bytes.size()) {
            return "needs " + std::to_string(size) + " bytes";
        }
        Wire::SegmentTable const accepted(bytes.data(), limit);
        return std::to_string(accepted.segmentCount()) + " segments, " + std::to_string(accepted.bodyBytes()) +
               " bytes";
    } catch (Wire::Failure const &failure) {
        return std::to_string(static_cast<int>(failure.code())) + ": " + failure.sentence();
    }
}

TEST(SegmentTable, tells_the_size_of_table_and_body) {
    EXPECT_EQ(judged({0, 1}, 4096), "1 segments, 8 bytes");
    EXPECT_EQ(judged({1, 2, 3}, 4096), "2 segments, 40 bytes");
    EXPECT_EQ(judged({2, 2, 0, 3}, 4096), "3 segments, 40 bytes");
    EXPECT_EQ(Wire::SegmentTable::bytesOf(table({0, 1}).data()), 8U);
    EXPECT_EQ(Wire::SegmentTable::bytesOf(table({1, 1}).data()), 16U);
    EXPECT_EQ(Wire::SegmentTable::bytesOf(table({2, 1}).data()), 16U);
    EXPECT_EQ(Wire::SegmentTable::bytesOf(table({63, 1}).data()), Wire::SegmentTable::bytesMax);
}

TEST(SegmentTable, fault_17_accepts_the_limit_and_refuses_one_word_more) {
    EXPECT_EQ(judged({0, 131072}, Wire::requestBytesMax), "1 segments, 1048576 bytes");
    EXPECT_EQ(judged({0, 131073}, Wire::requestBytesMax),
              "4: a message announced 1048584 bytes, and at most 1048576 are allowed");
    EXPECT_EQ(judged({1, 131072, 1}, Wire::requestBytesMax),
              "4: a message announced 1048584 bytes, and at most 1048576 are allowed");
}

TEST(SegmentTable, fault_17_refuses_an_empty_body) {
    EXPECT_EQ(judged({0, 0}, Wire::replyBytesMax), "5: a message announced an empty body");
    EXPECT_EQ(judged({2, 0, 0, 0}, Wire::replyBytesMax), "5: a message announced an empty body");
}

TEST(SegmentTable, fault_17_refuses_the_largest_length) {
    EXPECT_EQ(judged({0, 0xFFFFFFFF}, Wire::replyBytesMax),
              "4: a message announced 34359738360 bytes, and at most 16777216 are allowed");
}

TEST(SegmentTable, fault_17_refuses_a_segment_count_that_wraps_to_zero) {
    EXPECT_EQ(judged({0xFFFFFFFF, 1}, Wire::replyBytesMax), "5: a message announced more than 64 segments");
    EXPECT_EQ(judged({64, 1}, Wire::replyBytesMax), "5: a message announced more than 64 segments");
}

TEST(SegmentTable, fault_20_adds_up_segments_without_overflow) {
    std::vector<std::uint32_t> numbers(65, 0xFFFFFFFF);
    numbers[0] = 63;
    EXPECT_EQ(judged(numbers, Wire::replyBytesMax),
              "4: a message announced 2199023255040 bytes, and at most 16777216 are allowed");
}

TEST(MessageBuffer, is_used_again_for_the_next_message) {
    Wire::MessageBuffer buffer;
    EXPECT_EQ(buffer.capacityBytes(), 0U);
    auto const *first = buffer.prepare(Wire::SegmentTable(table({0, 5000}).data(), Wire::replyBytesMax)).begin();
    std::size_t const capacity = buffer.capacityBytes();
    EXPECT_GE(capacity, 40000U);
    EXPECT_EQ(buffer.prepare(Wire::SegmentTable(table({0, 100}).data(), Wire::replyBytesMax)).begin(), first);
    EXPECT_EQ(buffer.capacityBytes(), capacity);
    buffer.release();
    EXPECT_EQ(buffer.capacityBytes(), 0U);
    EXPECT_EQ(buffer.segments().size(), 0U);
}

TEST(MessageBuffer, lays_the_segments_one_after_the_other) {
    Wire::MessageBuffer buffer;
    kj::ArrayPtr<kj::byte> const body =
        buffer.prepare(Wire::SegmentTable(table({2, 2, 0, 3}).data(), Wire::replyBytesMax));
    ASSERT_EQ(body.size(), 40U);
    ASSERT_EQ(buffer.segments().size(), 3U);
    EXPECT_EQ(buffer.segments()[0].asBytes().begin(), body.begin());
    EXPECT_EQ(buffer.segments()[1].size(), 0U);
    EXPECT_EQ(buffer.segments()[2].asBytes().begin(), body.begin() + 16);
    EXPECT_EQ(buffer.segments()[2].size(), 3U);
}

} // namespace
