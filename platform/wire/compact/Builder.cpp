// SPDX-License-Identifier: Apache-2.0
#include "wire/compact/Builder.h"

#include <algorithm>
#include <cstring>
#include <string>

#include "wire/Failure.h"

namespace Wire::Compact {

namespace {

/// Pointers reach this far, and lists are this long.
constexpr std::size_t reach = (std::size_t{1} << 29) - 1;

/// Words from behind a pointer to its target.
std::int64_t offsetOf(std::size_t pointerPlace, std::size_t target) {
    return static_cast<std::int64_t>(target) - static_cast<std::int64_t>(pointerPlace) - 1;
}

void requireElements(std::size_t count) {
    if (count > reach) {
        throw Failure(ErrorCode::MessageTooLarge,
                      "a list of " + std::to_string(count) + " elements does not fit into a message");
    }
}

void writePointer(MessageBuilder &message, std::size_t place, Pointer pointer) {
    store(message.at(place), pointer.bits());
}

/// @param ending bytes behind those that are copied, all zero
void writeBytes(MessageBuilder &message, std::size_t pointerPlace, void const *bytes, std::size_t size,
                std::size_t ending) {
    ListRoom const room = writeList(message, pointerPlace, ElementSize::Byte, size + ending);
    if (size > 0) {
        std::memcpy(message.at(room.first), bytes, size);
    }
}

} // namespace

std::size_t MessageBuilder::allocate(std::size_t words) {
    if (words > reach - size_) {
        throw Failure(ErrorCode::MessageTooLarge, "the parts of a message do not reach each other any more");
    }
    if (words > capacity_ - size_) {
        grow(size_ + words);
    }
    std::size_t const place = size_;
    std::fill_n(words_ + place, words, Word{0});
    size_ += words;
    return place;
}

void MessageBuilder::grow(std::size_t words) {
    std::size_t const capacity = std::max(words, 2 * capacity_);
    std::unique_ptr<Word[]> grown(new Word[capacity]);
    std::copy_n(words_, size_, grown.get());
    grown_ = std::move(grown);
    words_ = grown_.get();
    capacity_ = capacity;
}

StructBuilder StructBuilder::init(MessageBuilder &message, std::size_t pointerPlace, StructSize size) {
    std::size_t const target = message.allocate(size.words());
    // A structure of nothing lies where its pointer is: a pointer of zeros would mean that there is none.
    std::int64_t const offset = size.words() > 0 ? offsetOf(pointerPlace, target) : -1;
    writePointer(message, pointerPlace, Pointer::toStruct(offset, size));
    return StructBuilder(&message, target, size.dataWords);
}

void writeText(MessageBuilder &message, std::size_t pointerPlace, std::string_view text) {
    writeBytes(message, pointerPlace, text.data(), text.size(), 1);
}

void writeData(MessageBuilder &message, std::size_t pointerPlace, std::span<std::uint8_t const> data) {
    writeBytes(message, pointerPlace, data.data(), data.size(), 0);
}

ListRoom writeList(MessageBuilder &message, std::size_t pointerPlace, ElementSize size, std::size_t count) {
    requireElements(count);
    std::size_t const words = (count * bytesOfElement(size) + bytesPerWord - 1) / bytesPerWord;
    std::size_t const first = message.allocate(words);
    writePointer(message, pointerPlace, Pointer::toList(offsetOf(pointerPlace, first), size, count));
    return {&message, first, static_cast<std::uint32_t>(count)};
}

ListRoom writeStructList(MessageBuilder &message, std::size_t pointerPlace, StructSize size, std::size_t count) {
    requireElements(count);
    std::size_t const words = count * size.words();
    requireElements(words);
    std::size_t const tag = message.allocate(1 + words);
    writePointer(message, pointerPlace, Pointer::toList(offsetOf(pointerPlace, tag), ElementSize::Composite, words));
    writePointer(message, tag, Pointer::tag(count, size));
    return {&message, tag + 1, static_cast<std::uint32_t>(count)};
}

} // namespace Wire::Compact
