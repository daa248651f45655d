// SPDX-License-Identifier: Apache-2.0
//
// The head of a message in Cap'n Proto's stream framing: how many segments follow and how long each one is. Both ends
// read it here, the client from a blocking descriptor and the daemon from its event loop: read prefixBytes, ask
// bytesOf, read the rest of the table, construct. Nothing is allocated, and a table that passed names a body within
// the limit.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "wire/Limits.h"

namespace Wire {

class SegmentTable {
public:
    /// Every table has this many bytes at least; they tell the size of the whole.
    static constexpr std::size_t prefixBytes = 8;
    /// The largest table that is accepted.
    static constexpr std::size_t bytesMax = (4 + 4 * std::size_t{segmentCountMax} + 7) / 8 * 8;

    /// @param prefix the table's first prefixBytes bytes
    /// @return bytes of the whole table, the prefix included; at most bytesMax
    /// @throw Failure ProtocolError for a number of segments that is never sent
    static std::size_t bytesOf(std::uint8_t const *prefix);

    /// A message without segments.
    SegmentTable() = default;
    /// @param table     the whole table, bytesOf(table) bytes
    /// @param bodyLimit the most bytes that the body may have
    /// @throw Failure ProtocolError for an empty body, MessageTooLarge for one above the limit
    SegmentTable(std::uint8_t const *table, std::size_t bodyLimit);

    std::uint32_t segmentCount() const {
        return segmentCount_;
    }
    std::uint32_t segmentWords(std::uint32_t segment) const {
        return words_[segment];
    }
    std::size_t bodyBytes() const {
        return bodyBytes_;
    }

private:
    std::uint32_t segmentCount_ = 0;
    std::size_t bodyBytes_ = 0;
    std::array<std::uint32_t, segmentCountMax> words_{};
};

} // namespace Wire
