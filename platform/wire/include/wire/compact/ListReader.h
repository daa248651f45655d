// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <type_traits>

#include "wire/compact/StructReader.h"

namespace Wire::Compact {

/// Stands for the schema's Text where a list's elements are named.
struct Text;

/// A list of structures, of texts or of numbers; List<Element>::Reader and ::Builder.
template <typename Element>
struct List;

/// Goes through a list by place; what it stands on is the element itself.
template <typename Reader>
class ListIterator {
public:
    ListIterator(Reader const *list, std::uint32_t place)
        : list_(list)
        , place_(place) {}
    auto operator*() const {
        return (*list_)[place_];
    }
    ListIterator &operator++() {
        ++place_;
        return *this;
    }
    bool operator==(ListIterator const &other) const {
        return place_ == other.place_;
    }

private:
    Reader const *list_;
    std::uint32_t place_;
};

/// What the three kinds of lists have in common. A list that is not there is empty.
template <typename Self>
class ListReaderBase {
public:
    std::uint32_t size() const {
        return place_.count;
    }
    ListIterator<Self> begin() const {
        return {static_cast<Self const *>(this), 0};
    }
    ListIterator<Self> end() const {
        return {static_cast<Self const *>(this), size()};
    }

protected:
    ListReaderBase() = default;
    explicit ListReaderBase(ListPlace const &place)
        : place_(place) {}
    std::uint8_t const *elementAt(std::uint32_t place) const {
        assert(place < size());
        return place_.first + std::size_t{place} * place_.stepBytes;
    }

    ListPlace place_;
};

template <typename Element>
class StructListReader : public ListReaderBase<StructListReader<Element>> {
public:
    static constexpr ElementSize elementSize = ElementSize::Composite;

    StructListReader() = default;
    explicit StructListReader(ListPlace const &place)
        : ListReaderBase<StructListReader>(place) {}
    typename Element::Reader operator[](std::uint32_t place) const {
        ListPlace const &list = this->place_;
        if (list.nesting <= 0) {
            malformed("it nests too deeply");
        }
        return typename Element::Reader(
            StructReader(list.segment, this->elementAt(place), list.dataBytes, list.pointerCount, list.nesting - 1));
    }
};

class TextListReader : public ListReaderBase<TextListReader> {
public:
    static constexpr ElementSize elementSize = ElementSize::Pointer;

    TextListReader() = default;
    explicit TextListReader(ListPlace const &place)
        : ListReaderBase(place) {}
    std::string_view operator[](std::uint32_t place) const {
        return readText(*place_.segment, reinterpret_cast<Word const *>(elementAt(place)));
    }
};

template <typename Number>
class NumberListReader : public ListReaderBase<NumberListReader<Number>> {
public:
    static constexpr ElementSize elementSize = elementSizeOf<Number>;

    NumberListReader() = default;
    explicit NumberListReader(ListPlace const &place)
        : ListReaderBase<NumberListReader>(place) {}
    Number operator[](std::uint32_t place) const {
        return loaded<Number>(this->elementAt(place));
    }
};

} // namespace Wire::Compact
