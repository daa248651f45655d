// SPDX-License-Identifier: Apache-2.0
#include "wire/compact/MessageReader.h"

namespace Wire::Compact {

void malformed(char const *what) {
    throw Malformed(what);
}

MessageReader::MessageReader(SegmentTable const &table, Word const *body)
    : visits_(std::uint64_t{visitsOfAWordMax} * (table.bodyBytes() / bytesPerWord)) {
    for (; segments_.count < table.segmentCount(); ++segments_.count) {
        Word const *const end = body + table.segmentWords(segments_.count);
        segments_.segments[segments_.count] = Segment{body, end, &visits_, &segments_};
        body = end;
    }
}

StructReader MessageReader::root() {
    Segment const &first = segments_.segments[0];
    first.require(first.begin, 1);
    visits_.count(1); // the library looks at this word twice, and what it refuses is refused here
    return StructReader::at(first, first.begin, nestingMax);
}

Target throughLandingPad(Segment const &segment, Pointer pointer) {
    SegmentList const &all = *segment.all;
    if (pointer.padSegment() >= all.count) {
        malformed("a pointer leads to a segment that is not there");
    }
    Segment const &padSegment = all.segments[pointer.padSegment()];
    Word const *const pad = padSegment.clamped(padSegment.begin, static_cast<std::int32_t>(pointer.padPlace()));
    padSegment.require(pad, pointer.isDoubleFar() ? 2 : 1);
    Pointer const landed(loaded<Word>(pad));
    if (!pointer.isDoubleFar()) {
        return {&padSegment, landed, padSegment.clamped(pad + 1, landed.offset())};
    }
    if (landed.padSegment() >= all.count || landed.kind() != Pointer::Far) {
        malformed("a landing pad leads nowhere");
    }
    Segment const &last = all.segments[landed.padSegment()];
    return {&last, Pointer(loaded<Word>(pad + 1)),
            last.clamped(last.begin, static_cast<std::int32_t>(landed.padPlace()))};
}

ListPlace compositeList(Target const &target, ElementSize expected, int nesting) {
    std::uint64_t const words = target.pointer.elementCount();
    target.segment->require(target.words, words + 1);
    Pointer const tag(loaded<Word>(target.words));
    if (tag.kind() != Pointer::Struct) {
        malformed("a list of structures is one of something else");
    }
    StructSize const size = tag.structSize();
    if (std::uint64_t{tag.tagCount()} * size.words() > words) {
        malformed("a list of structures has more elements than room");
    }
    if (size.words() == 0) {
        target.segment->visits->count(tag.tagCount()); // any number of them fits into no room at all
    }
    Word const *first = target.words + 1;
    if (expected == ElementSize::Pointer) {
        first += size.dataWords;
        if (size.pointerCount == 0) {
            malformed("structures without pointers stand for texts");
        }
    } else if (expected != ElementSize::Composite && size.dataWords == 0) {
        malformed("structures without data stand for numbers");
    }
    return {target.segment,
            reinterpret_cast<std::uint8_t const *>(first),
            tag.tagCount(),
            static_cast<std::uint32_t>(size.words() * bytesPerWord),
            static_cast<std::uint32_t>(size.dataWords * bytesPerWord),
            size.pointerCount,
            static_cast<std::int16_t>(nesting - 1)};
}

} // namespace Wire::Compact
