// SPDX-License-Identifier: Apache-2.0
//
// Writing requests without the Cap'n Proto library; the counterpart of MessageReader.h. A message is one segment that
// grows, so builders hold places and no addresses. A text, list or structure that is set again leaves the old one in
// the message: set each field once.
#pragma once

#include <cassert>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

#include "wire/compact/Pointer.h"

namespace Wire::Compact {

/// One message on its way out.
class MessageBuilder {
public:
    MessageBuilder() = default;
    MessageBuilder(MessageBuilder const &) = delete;
    MessageBuilder &operator=(MessageBuilder const &) = delete;

    /// Call it once, first.
    template <typename Struct>
    typename Struct::Builder initRoot();

    /// The segment. Valid until something is added.
    std::span<Word const> words() const {
        return {words_, size_};
    }

    /// For builders: room at the end, all zero.
    /// @return its place
    /// @throw Failure MessageTooLarge when no pointer could reach it; std::bad_alloc
    std::size_t allocate(std::size_t words);
    Word *at(std::size_t place) {
        return words_ + place;
    }

private:
    void grow(std::size_t words);

    /// Nearly every request fits.
    static constexpr std::size_t scratchWords = 128;

    Word scratch_[scratchWords];
    std::unique_ptr<Word[]> grown_;
    Word *words_ = scratch_;
    std::size_t capacity_ = scratchWords;
    std::size_t size_ = 0;
};

/// Where the elements of a list in the making begin.
struct ListRoom {
    MessageBuilder *message = nullptr;
    std::size_t first = 0;
    std::uint32_t count = 0;
};

/// Writes a text and its pointer.
/// @throw Failure MessageTooLarge, std::bad_alloc
void writeText(MessageBuilder &message, std::size_t pointerPlace, std::string_view text);
void writeData(MessageBuilder &message, std::size_t pointerPlace, std::span<std::uint8_t const> data);
/// Makes room for the elements of a list, and the pointer to it.
ListRoom writeList(MessageBuilder &message, std::size_t pointerPlace, ElementSize size, std::size_t count);
ListRoom writeStructList(MessageBuilder &message, std::size_t pointerPlace, StructSize size, std::size_t count);

/// A structure in the making; what generated builders are made of.
class StructBuilder {
public:
    StructBuilder(MessageBuilder *message, std::size_t place, std::uint16_t dataWords)
        : message_(message)
        , place_(place)
        , dataWords_(dataWords) {}

    /// Makes room for a structure, and the pointer to it.
    static StructBuilder init(MessageBuilder &message, std::size_t pointerPlace, StructSize size);

protected:
    /// @param place in units of the number's size
    template <typename Number>
    Number number(std::uint32_t place) const {
        return loaded<Number>(reinterpret_cast<std::uint8_t const *>(message_->at(place_)) + place * sizeof(Number));
    }
    template <typename Number>
    void setNumber(std::uint32_t place, Number number) {
        store(bytes() + place * sizeof(Number), number);
    }
    void setBit(std::uint32_t place, bool value) {
        std::uint8_t &byte = bytes()[place / 8];
        auto const mask = static_cast<std::uint8_t>(1U << place % 8);
        byte = static_cast<std::uint8_t>(value ? byte | mask : byte & ~mask);
    }
    void setText(std::uint32_t place, std::string_view text) {
        writeText(*message_, pointerPlace(place), text);
    }
    void setData(std::uint32_t place, std::span<std::uint8_t const> data) {
        writeData(*message_, pointerPlace(place), data);
    }
    template <typename Struct>
    typename Struct::Builder initStruct(std::uint32_t place) {
        return typename Struct::Builder(init(*message_, pointerPlace(place), Struct::size));
    }
    template <typename Builder>
    Builder initList(std::uint32_t place, std::size_t count) {
        return Builder(Builder::write(*message_, pointerPlace(place), count));
    }

private:
    std::uint8_t *bytes() {
        return reinterpret_cast<std::uint8_t *>(message_->at(place_));
    }
    std::size_t pointerPlace(std::uint32_t place) const {
        return place_ + dataWords_ + place;
    }

    MessageBuilder *message_;
    std::size_t place_;
    std::uint16_t dataWords_;
};

template <typename Struct>
typename Struct::Builder MessageBuilder::initRoot() {
    return typename Struct::Builder(StructBuilder::init(*this, allocate(1), Struct::size));
}

class ListBuilderBase {
public:
    std::uint32_t size() const {
        return room_.count;
    }

protected:
    explicit ListBuilderBase(ListRoom const &room)
        : room_(room) {}
    ListRoom room_;
};

template <typename Element>
class StructListBuilder : public ListBuilderBase {
public:
    explicit StructListBuilder(ListRoom const &room)
        : ListBuilderBase(room) {}
    static ListRoom write(MessageBuilder &message, std::size_t pointerPlace, std::size_t count) {
        return writeStructList(message, pointerPlace, Element::size, count);
    }
    typename Element::Builder operator[](std::uint32_t place) {
        assert(place < size());
        std::size_t const there = room_.first + std::size_t{place} * Element::size.words();
        return typename Element::Builder(StructBuilder(room_.message, there, Element::size.dataWords));
    }
};

class TextListBuilder : public ListBuilderBase {
public:
    explicit TextListBuilder(ListRoom const &room)
        : ListBuilderBase(room) {}
    static ListRoom write(MessageBuilder &message, std::size_t pointerPlace, std::size_t count) {
        return writeList(message, pointerPlace, ElementSize::Pointer, count);
    }
    void set(std::uint32_t place, std::string_view text) {
        assert(place < size());
        writeText(*room_.message, room_.first + place, text);
    }
};

template <typename Number>
class NumberListBuilder : public ListBuilderBase {
public:
    explicit NumberListBuilder(ListRoom const &room)
        : ListBuilderBase(room) {}
    static ListRoom write(MessageBuilder &message, std::size_t pointerPlace, std::size_t count) {
        return writeList(message, pointerPlace, elementSizeOf<Number>, count);
    }
    void set(std::uint32_t place, Number number) {
        assert(place < size());
        store(reinterpret_cast<std::uint8_t *>(room_.message->at(room_.first)) + place * sizeof(Number), number);
    }
};

} // namespace Wire::Compact
