// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <cstring>
#include <numeric>
#include <string>
#include <vector>

#include <capnp/serialize.h>

#include "BothApis.h"
#include "wire/Limits.h"
#include "wire/MessageBuffer.h"
#include "wire/SegmentTable.h"

namespace CompactTest {

/// A message as it stands on the wire: words in segments.
using Segments = std::vector<std::vector<std::uint64_t>>;

inline Segments segmentsOf(capnp::MessageBuilder &message) {
    Segments segments;
    for (auto const segment : message.getSegmentsForOutput()) {
        auto const *words = reinterpret_cast<std::uint64_t const *>(segment.begin());
        segments.emplace_back(words, words + segment.size());
    }
    return segments;
}

inline Segments segmentsOf(Wire::Compact::MessageBuilder const &message) {
    return {{message.words().begin(), message.words().end()}};
}

/// What the table of a stream would say of them.
inline Wire::SegmentTable tableOf(Segments const &segments) {
    std::vector<std::uint32_t> numbers{static_cast<std::uint32_t>(segments.size() - 1)};
    for (auto const &segment : segments) {
        numbers.push_back(static_cast<std::uint32_t>(segment.size()));
    }
    return Wire::SegmentTable(reinterpret_cast<std::uint8_t const *>(numbers.data()), Wire::replyBytesMax);
}

/// Without a spare word, so that a sanitizer sees each read outside.
inline std::vector<std::uint64_t> bodyOf(Segments const &segments) {
    std::vector<std::uint64_t> body;
    for (auto const &segment : segments) {
        body.insert(body.end(), segment.begin(), segment.end());
    }
    body.shrink_to_fit();
    return body;
}

template <typename Struct>
std::string compactPrint(Segments const &segments) {
    std::vector<std::uint64_t> const body = bodyOf(segments);
    try {
        Wire::Compact::MessageReader reader(tableOf(segments), body.data());
        return BothApis::printed(reader.getRoot<Struct>());
    } catch (Wire::Compact::Malformed const &) {
        return "malformed";
    }
}

template <typename Struct>
std::string libraryPrint(Segments const &segments) {
    std::vector<kj::ArrayPtr<capnp::word const>> pieces;
    std::size_t words = 0;
    for (auto const &segment : segments) {
        pieces.push_back(kj::arrayPtr(reinterpret_cast<capnp::word const *>(segment.data()), segment.size()));
        words += segment.size();
    }
    try {
        capnp::SegmentArrayMessageReader reader(kj::arrayPtr(pieces.data(), pieces.size()),
                                                Wire::readerOptions(8 * words));
        return BothApis::printed(reader.getRoot<Struct>());
    } catch (kj::Exception const &) {
        return "malformed";
    }
}

} // namespace CompactTest
