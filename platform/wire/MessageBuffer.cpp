// SPDX-License-Identifier: Apache-2.0
#include "wire/MessageBuffer.h"

#include <algorithm>
#include <bit>

namespace Wire {

namespace {

/// Small answers, which are nearly all, need one allocation in the life of a connection.
constexpr std::size_t leastWords = 512;

} // namespace

capnp::ReaderOptions readerOptions(std::size_t bodyBytes) {
    capnp::ReaderOptions options;
    options.traversalLimitInWords = visitsOfAWordMax * (bodyBytes / sizeof(capnp::word));
    options.nestingLimit = nestingMax;
    return options;
}

kj::ArrayPtr<kj::byte> MessageBuffer::prepare(SegmentTable const &table) {
    std::size_t const needed = table.bodyBytes() / sizeof(capnp::word);
    if (needed > capacityWords_) {
        // Powers of two, so that chunks of nearly one size do not reallocate; pages that stay unused cost nothing.
        std::size_t const capacity = std::max(leastWords, std::bit_ceil(needed));
        release();
        words_ = std::make_unique_for_overwrite<capnp::word[]>(capacity);
        capacityWords_ = capacity;
    }
    table_ = table;
    capnp::word const *begin = words_.get();
    for (std::uint32_t segment = 0; segment < table.segmentCount(); ++segment) {
        segments_[segment] = kj::arrayPtr(begin, table.segmentWords(segment));
        begin += table.segmentWords(segment);
    }
    return kj::arrayPtr(reinterpret_cast<kj::byte *>(words_.get()), table.bodyBytes());
}

kj::ArrayPtr<kj::ArrayPtr<capnp::word const> const> MessageBuffer::segments() const {
    return kj::arrayPtr(segments_.data(), table_.segmentCount());
}

void MessageBuffer::release() {
    words_.reset();
    capacityWords_ = 0;
    table_ = SegmentTable();
}

} // namespace Wire
