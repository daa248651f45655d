// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <type_traits>

#include "wire/compact/Segment.h"

namespace Wire::Compact {

/// A list as it lies in a message, before its elements are given a type.
struct ListPlace {
    Segment const *segment = nullptr;
    std::uint8_t const *first = nullptr;
    std::uint32_t count = 0;
    std::uint32_t stepBytes = 0;
    std::uint32_t dataBytes = 0; // of an element, taken as a structure
    std::uint16_t pointerCount = 0;
    std::int16_t nesting = 0; // how many levels there may still be below
};

/// Bytes behind a pointer, not null, to a text or data.
/// @throw Malformed
inline std::span<std::uint8_t const> readBytes(Segment const &segment, Word const *place, Pointer pointer) {
    Target const target = followed(segment, place, pointer);
    if (target.pointer.kind() != Pointer::List || target.pointer.elementSize() != ElementSize::Byte) {
        malformed("text or data is something else");
    }
    std::size_t const bytes = target.pointer.elementCount();
    target.segment->require(target.words, (bytes + bytesPerWord - 1) / bytesPerWord);
    return {reinterpret_cast<std::uint8_t const *>(target.words), bytes};
}

/// A text, followed by a NUL that is not part of it; a null pointer is the empty text.
/// @throw Malformed
inline std::string_view readText(Segment const &segment, Word const *place) {
    Pointer const pointer(loaded<Word>(place));
    if (pointer.isNull()) {
        return "";
    }
    std::span<std::uint8_t const> const bytes = readBytes(segment, place, pointer);
    if (bytes.empty() || bytes.back() != 0) {
        malformed("a text does not end in NUL");
    }
    return std::string_view(reinterpret_cast<char const *>(bytes.data()), bytes.size() - 1);
}

/// The list of structures that a pointer leads to. Whoever expects texts or numbers gets the first pointer or number of
/// each.
/// @throw Malformed
ListPlace compositeList(Target const &target, ElementSize expected, int nesting);

/// A list whose pointer is not null.
/// @param expected what the caller's elements are; what is read may be larger, or structures that begin with it
/// @throw Malformed
inline ListPlace readList(Segment const &segment, Word const *place, Pointer pointer, ElementSize expected,
                          int nesting) {
    if (nesting <= 0) {
        malformed("it nests too deeply");
    }
    Target const target = followed(segment, place, pointer);
    if (target.pointer.kind() != Pointer::List) {
        malformed("a list is something else");
    }
    ElementSize const size = target.pointer.elementSize();
    if (size == ElementSize::Composite) {
        return compositeList(target, expected, nesting);
    }
    if (size == ElementSize::Bit) {
        malformed("a list is one of bits");
    }
    std::uint32_t const count = target.pointer.elementCount();
    std::uint32_t const bytes = bytesOfElement(size);
    target.segment->require(target.words, (std::uint64_t{count} * bytes + bytesPerWord - 1) / bytesPerWord);
    if (size == ElementSize::Void) {
        target.segment->visits->count(count); // any number of them fits into no room at all
    }
    bool const pointers = size == ElementSize::Pointer;
    bool const fits = expected == ElementSize::Composite ||
                      (expected == ElementSize::Pointer ? pointers : !pointers && bytesOfElement(expected) <= bytes);
    if (!fits) {
        malformed("a list has smaller elements");
    }
    return {target.segment,
            reinterpret_cast<std::uint8_t const *>(target.words),
            count,
            bytes,
            pointers ? 0 : bytes,
            static_cast<std::uint16_t>(pointers ? 1 : 0),
            static_cast<std::int16_t>(nesting - 1)};
}

/// A structure as it lies in a message, or one that is not there, whose fields all have their defaults. What generated
/// readers are made of.
class StructReader {
public:
    StructReader() = default;
    StructReader(Segment const *segment, std::uint8_t const *data, std::uint32_t dataBytes, std::uint16_t pointerCount,
                 int nesting)
        : segment_(segment)
        , data_(data)
        , dataBytes_(dataBytes)
        , pointerCount_(pointerCount)
        , nesting_(static_cast<std::int16_t>(nesting)) {}

    /// The structure behind the pointer at a place.
    /// @throw Malformed
    static StructReader at(Segment const &segment, Word const *place, int nesting) {
        Pointer const pointer(loaded<Word>(place));
        if (pointer.isNull()) {
            return StructReader();
        }
        if (nesting <= 0) {
            malformed("it nests too deeply");
        }
        Target const target = followed(segment, place, pointer);
        if (target.pointer.kind() != Pointer::Struct) {
            malformed("a structure is something else");
        }
        StructSize const size = target.pointer.structSize();
        target.segment->require(target.words, size.words());
        return StructReader(target.segment, reinterpret_cast<std::uint8_t const *>(target.words),
                            static_cast<std::uint32_t>(size.dataWords * bytesPerWord), size.pointerCount, nesting - 1);
    }

protected:
    /// @param place in units of the number's size
    template <typename Number>
    Number number(std::uint32_t place) const {
        std::size_t const end = (std::size_t{place} + 1) * sizeof(Number);
        return end <= dataBytes_ ? loaded<Number>(data_ + end - sizeof(Number)) : Number{};
    }
    bool bit(std::uint32_t place) const {
        return place / 8 < dataBytes_ && (data_[place / 8] >> place % 8 & 1) != 0;
    }
    bool hasPointer(std::uint32_t place) const {
        return place < pointerCount_ && loaded<Word>(pointerAt(place)) != 0;
    }
    std::string_view text(std::uint32_t place) const {
        return place < pointerCount_ ? readText(*segment_, pointerAt(place)) : std::string_view("");
    }
    std::span<std::uint8_t const> data(std::uint32_t place) const {
        if (!hasPointer(place)) {
            return {};
        }
        Word const *const there = pointerAt(place);
        return readBytes(*segment_, there, Pointer(loaded<Word>(there)));
    }
    template <typename Reader>
    Reader structure(std::uint32_t place) const {
        return Reader(place < pointerCount_ ? at(*segment_, pointerAt(place), nesting_) : StructReader());
    }
    template <typename Reader>
    Reader list(std::uint32_t place) const {
        if (!hasPointer(place)) {
            return Reader();
        }
        Word const *const there = pointerAt(place);
        return Reader(readList(*segment_, there, Pointer(loaded<Word>(there)), Reader::elementSize, nesting_));
    }

private:
    Word const *pointerAt(std::uint32_t place) const {
        return reinterpret_cast<Word const *>(data_ + dataBytes_) + place;
    }

    Segment const *segment_ = nullptr;
    std::uint8_t const *data_ = nullptr;
    std::uint32_t dataBytes_ = 0;
    std::uint16_t pointerCount_ = 0;
    std::int16_t nesting_ = 0;
};

} // namespace Wire::Compact
