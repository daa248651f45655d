// SPDX-License-Identifier: Apache-2.0
//
// The encoding's smallest parts: words as they lie in a message, and the pointers among them.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace Wire::Compact {

using Word = std::uint64_t;
inline constexpr std::size_t bytesPerWord = sizeof(Word);

/// What the elements of a list are, in the numbers of the encoding.
enum class ElementSize : std::uint8_t {
    Void = 0,
    Bit = 1,
    Byte = 2,
    TwoBytes = 3,
    FourBytes = 4,
    EightBytes = 5,
    Pointer = 6,
    Composite = 7,
};

/// Bytes of one element that is neither a bit nor a structure.
inline constexpr std::uint32_t bytesOfElement(ElementSize size) {
    constexpr std::uint8_t bytes[] = {0, 0, 1, 2, 4, 8, 8, 0};
    return bytes[static_cast<std::size_t>(size)];
}

/// The element size of a list of numbers.
template <typename Number>
inline constexpr ElementSize elementSizeOf = sizeof(Number) == 1   ? ElementSize::Byte
                                             : sizeof(Number) == 2 ? ElementSize::TwoBytes
                                             : sizeof(Number) == 4 ? ElementSize::FourBytes
                                                                   : ElementSize::EightBytes;

/// Words of the two sections of a structure.
struct StructSize {
    std::uint16_t dataWords;
    std::uint16_t pointerCount;
    constexpr std::uint32_t words() const {
        return std::uint32_t{dataWords} + pointerCount;
    }
};

/// A number that lies in a message, wherever it lies. Messages are little-endian on every machine; turning a number's
/// bytes round and turning them back is the same.
template <typename Number>
Number turned(Number number) {
    static_assert(std::is_arithmetic_v<Number> && !std::is_same_v<Number, bool>);
    if constexpr (std::endian::native == std::endian::big) {
        unsigned char bytes[sizeof(Number)];
        std::memcpy(bytes, &number, sizeof(Number));
        for (std::size_t place = 0; place < sizeof(Number) / 2; ++place) {
            unsigned char const low = bytes[place];
            bytes[place] = bytes[sizeof(Number) - 1 - place];
            bytes[sizeof(Number) - 1 - place] = low;
        }
        std::memcpy(&number, bytes, sizeof(Number));
    }
    return number;
}

template <typename Number>
Number loaded(void const *place) {
    Number number;
    std::memcpy(&number, place, sizeof(Number));
    return turned(number);
}

template <typename Number>
void store(void *place, Number number) {
    number = turned(number);
    std::memcpy(place, &number, sizeof(Number));
}

/// One pointer, taken apart. Which parts mean something depends on its kind.
class Pointer {
public:
    enum Kind : unsigned { Struct = 0, List = 1, Far = 2, Other = 3 };

    explicit constexpr Pointer(Word bits)
        : bits_(bits) {}
    static constexpr Pointer toStruct(std::int64_t offset, StructSize size) {
        return Pointer(offsetBits(offset) | Struct | Word{size.dataWords} << 32 | Word{size.pointerCount} << 48);
    }
    /// @param count elements; of a composite list, the words behind its tag
    static constexpr Pointer toList(std::int64_t offset, ElementSize size, std::uint64_t count) {
        return Pointer(offsetBits(offset) | List | static_cast<Word>(size) << 32 | Word{count} << 35);
    }
    /// What stands before the elements of a composite list.
    static constexpr Pointer tag(std::uint64_t count, StructSize size) {
        return toStruct(static_cast<std::int64_t>(count), size);
    }

    constexpr Word bits() const {
        return bits_;
    }
    constexpr bool isNull() const {
        return bits_ == 0;
    }
    constexpr unsigned kind() const {
        return static_cast<unsigned>(bits_ & 3);
    }

    /// Struct and list: words from behind the pointer to its target.
    constexpr std::int32_t offset() const {
        return static_cast<std::int32_t>(bits_ & 0xFFFFFFFF) >> 2;
    }
    constexpr StructSize structSize() const {
        return {static_cast<std::uint16_t>(bits_ >> 32), static_cast<std::uint16_t>(bits_ >> 48)};
    }
    constexpr ElementSize elementSize() const {
        return static_cast<ElementSize>(bits_ >> 32 & 7);
    }
    /// Elements of a list; of a composite list, the words behind its tag.
    constexpr std::uint32_t elementCount() const {
        return static_cast<std::uint32_t>(bits_ >> 35);
    }
    /// Elements, when this is the tag of a composite list. They have 29 bits, as in every list; the 30th counts
    /// nowhere.
    constexpr std::uint32_t tagCount() const {
        return static_cast<std::uint32_t>(bits_) >> 2 & 0x1FFFFFFF;
    }

    /// Far: through a landing pad of two words, whose second one describes the target.
    constexpr bool isDoubleFar() const {
        return (bits_ & 4) != 0;
    }
    constexpr std::uint32_t padPlace() const {
        return static_cast<std::uint32_t>(bits_) >> 3;
    }
    constexpr std::uint32_t padSegment() const {
        return static_cast<std::uint32_t>(bits_ >> 32);
    }

private:
    static constexpr Word offsetBits(std::int64_t offset) {
        return static_cast<Word>(offset) << 2 & 0xFFFFFFFF;
    }

    Word bits_;
};

} // namespace Wire::Compact
