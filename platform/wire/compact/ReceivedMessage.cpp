// SPDX-License-Identifier: Apache-2.0
#include "wire/compact/ReceivedMessage.h"

#include <algorithm>
#include <bit>

namespace Wire::Compact {

namespace {

/// Small answers, which are nearly all, need one allocation in the life of a connection.
constexpr std::size_t leastWords = 512;

} // namespace

std::span<std::uint8_t> ReceivedMessage::prepare(SegmentTable const &table) {
    reader_.reset();
    std::size_t const needed = table.bodyBytes() / bytesPerWord;
    if (needed > capacityWords_) {
        // Powers of two, so that chunks of nearly one size do not reallocate; pages that stay unused cost nothing.
        std::size_t const capacity = std::max(leastWords, std::bit_ceil(needed));
        release();
        words_.reset(new Word[capacity]);
        capacityWords_ = capacity;
    }
    bodyBytes_ = table.bodyBytes();
    reader_.emplace(table, words_.get());
    return {reinterpret_cast<std::uint8_t *>(words_.get()), bodyBytes_};
}

void ReceivedMessage::release() {
    reader_.reset();
    words_.reset();
    capacityWords_ = 0;
    bodyBytes_ = 0;
}

} // namespace Wire::Compact
