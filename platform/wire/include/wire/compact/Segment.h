// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "wire/Limits.h"
#include "wire/compact/Malformed.h"
#include "wire/compact/Pointer.h"

namespace Wire::Compact {

/// How many words of a message may still be visited.
class Visits {
public:
    explicit Visits(std::uint64_t words)
        : left_(words) {}
    /// @throw Malformed
    void count(std::uint64_t words) {
        if (words > left_) {
            malformed("its words are visited too often");
        }
        left_ -= words;
    }

private:
    std::uint64_t left_;
};

struct SegmentList;

/// One piece of a message.
struct Segment {
    Word const *begin = nullptr;
    Word const *end = nullptr;
    Visits *visits = nullptr;
    SegmentList const *all = nullptr;

    /// Where so many words behind a place are; what lies outside is the end, where nothing but nothing fits.
    Word const *clamped(Word const *from, std::int32_t offset) const {
        std::ptrdiff_t const place = from - begin + offset;
        return place >= 0 && place <= end - begin ? begin + place : end;
    }
    /// Makes sure that an object lies inside, and counts the visit.
    /// @throw Malformed
    void require(Word const *object, std::uint64_t words) const {
        if (words > static_cast<std::uint64_t>(end - object)) {
            malformed("a pointer leads outside");
        }
        visits->count(words);
    }
};

struct SegmentList {
    std::array<Segment, segmentCountMax> segments;
    std::uint32_t count = 0;
};

/// What a pointer leads to.
struct Target {
    Segment const *segment;
    Pointer pointer; // the one that describes the target: its kind and sizes count, its offset was followed
    Word const *words;
};

/// The same for a pointer that leads to another segment.
/// @throw Malformed
Target throughLandingPad(Segment const &segment, Pointer pointer);

/// Follows the pointer at a place. It is not null.
/// @throw Malformed
inline Target followed(Segment const &segment, Word const *place, Pointer pointer) {
    if (pointer.kind() == Pointer::Far) {
        return throughLandingPad(segment, pointer);
    }
    return {&segment, pointer, segment.clamped(place + 1, pointer.offset())};
}

} // namespace Wire::Compact
