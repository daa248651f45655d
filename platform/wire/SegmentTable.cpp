// SPDX-License-Identifier: Apache-2.0
#include "wire/SegmentTable.h"

#include <string>

#include "wire/Failure.h"

namespace Wire {

namespace {

constexpr std::uint64_t bytesPerWord = 8;

std::uint32_t littleEndian(std::uint8_t const *bytes) {
    return static_cast<std::uint32_t>(bytes[0]) | static_cast<std::uint32_t>(bytes[1]) << 8 |
           static_cast<std::uint32_t>(bytes[2]) << 16 | static_cast<std::uint32_t>(bytes[3]) << 24;
}

/// The first number is one less than the number of segments; compared before it is added to, so that it cannot wrap.
std::uint32_t checkedSegmentCount(std::uint8_t const *prefix) {
    std::uint32_t const lastSegment = littleEndian(prefix);
    if (lastSegment >= segmentCountMax) {
        throw Failure(ErrorCode::ProtocolError,
                      "a message announced more than " + std::to_string(segmentCountMax) + " segments");
    }
    return lastSegment + 1;
}

} // namespace

std::size_t SegmentTable::bytesOf(std::uint8_t const *prefix) {
    std::size_t const numbers = 1 + std::size_t{checkedSegmentCount(prefix)};
    return (4 * numbers + 7) / 8 * 8;
}

SegmentTable::SegmentTable(std::uint8_t const *table, std::size_t bodyLimit)
    : segmentCount_(checkedSegmentCount(table)) {
    std::uint64_t words = 0;
    for (std::uint32_t segment = 0; segment < segmentCount_; ++segment) {
        words_[segment] = littleEndian(table + 4 + 4 * std::size_t{segment});
        words += words_[segment];
    }
    if (words == 0) {
        throw Failure(ErrorCode::ProtocolError, "a message announced an empty body");
    }
    if (words > bodyLimit / bytesPerWord) {
        throw Failure(ErrorCode::MessageTooLarge, "a message announced " + std::to_string(words * bytesPerWord) +
                                                      " bytes, and at most " + std::to_string(bodyLimit) +
                                                      " are allowed");
    }
    bodyBytes_ = static_cast<std::size_t>(words * bytesPerWord);
}

} // namespace Wire
