// SPDX-License-Identifier: Apache-2.0
//
// What messages of our schema do not come to, and those of a later one may: lists of numbers that grew, lists far down,
// messages that no pointer reaches across.
#include <gtest/gtest.h>

#include "CompactFixture.h"
#include "wire/Failure.h"

namespace CompactTest {

namespace {

using Wire::Compact::ElementSize;
using Wire::Compact::Malformed;
using Wire::Compact::MessageBuilder;
using Wire::Compact::Pointer;
using Wire::Compact::StructReader;
using Wire::Compact::StructSize;

/// A structure whose one pointer leads to another, or to numbers.
class Node : public StructReader {
public:
    using Reader = Node;
    explicit Node(StructReader const &place)
        : StructReader(place) {}
    Node next() const {
        return structure<Node>(0);
    }
    Wire::Compact::NumberListReader<std::uint32_t> numbers() const {
        return list<Wire::Compact::NumberListReader<std::uint32_t>>(0);
    }
    bool holdsSomething() const {
        return hasPointer(0);
    }
};

/// The numbers that a root's pointer leads to, as "1 2 3", or why not.
std::string numbersOf(std::uint64_t pointer, std::vector<std::uint64_t> const &behind) {
    std::vector<std::uint64_t> words{Pointer::toStruct(0, {0, 1}).bits(), pointer};
    words.insert(words.end(), behind.begin(), behind.end());
    Wire::Compact::MessageReader reader(tableOf({words}), words.data());
    try {
        std::string text;
        for (std::uint32_t const number : reader.getRoot<Node>().numbers()) {
            text += (text.empty() ? "" : " ") + std::to_string(number);
        }
        return text;
    } catch (Malformed const &failure) {
        return failure.what();
    }
}

std::uint64_t listTo(ElementSize size, std::uint64_t count) {
    return Pointer::toList(0, size, count).bits();
}

/// The sentence of the failure that an operation ends with, with its code in front.
template <typename Work>
std::string failureOf(Work const &work) {
    try {
        work();
        return "none";
    } catch (Wire::Failure const &failure) {
        return (failure.code() == Wire::ErrorCode::MessageTooLarge ? "too large: " : "another code: ") +
               failure.sentence();
    }
}

TEST(CompactParts, numbers_are_read_from_whatever_begins_with_them) {
    EXPECT_EQ(numbersOf(listTo(ElementSize::FourBytes, 3), {std::uint64_t{2} << 32 | 1, 3}), "1 2 3");
    EXPECT_EQ(numbersOf(listTo(ElementSize::EightBytes, 2), {7, 8}), "7 8");
    EXPECT_EQ(numbersOf(listTo(ElementSize::Composite, 4), {Pointer::tag(2, {1, 1}).bits(), 7, 0, 8, 0}), "7 8");
    EXPECT_EQ(numbersOf(0, {}), "");
}

TEST(CompactParts, numbers_are_not_read_from_what_is_none) {
    std::string const refused = numbersOf(listTo(ElementSize::TwoBytes, 2), {0});
    EXPECT_NE(refused.find("a list has smaller elements"), std::string::npos) << refused;
    EXPECT_EQ(numbersOf(listTo(ElementSize::Pointer, 1), {0}), refused);
    std::string const empty = numbersOf(listTo(ElementSize::Composite, 1), {Pointer::tag(1, {0, 1}).bits(), 0});
    EXPECT_NE(empty.find("structures without data stand for numbers"), std::string::npos) << empty;
}

TEST(CompactParts, a_list_past_the_nesting_limit_is_refused) {
    std::vector<std::uint64_t> const words(1000, Pointer::toStruct(0, {0, 1}).bits());
    Wire::Compact::MessageReader reader(tableOf({words}), words.data());
    Node place = reader.getRoot<Node>();
    for (int depth = 1; depth < Wire::nestingMax; ++depth) {
        place = place.next();
    }
    EXPECT_TRUE(place.holdsSomething());
    EXPECT_THROW(place.numbers(), Malformed);
}

TEST(CompactParts, a_structure_of_nothing_is_there) {
    MessageBuilder message;
    message.allocate(1);
    Wire::Compact::StructBuilder::init(message, 0, StructSize{0, 0});
    ASSERT_EQ(message.words().size(), 1U);
    EXPECT_EQ(Pointer(message.words()[0]).offset(), -1);
    EXPECT_FALSE(Pointer(message.words()[0]).isNull());
}

TEST(CompactParts, what_no_pointer_reaches_is_not_written) {
    constexpr std::size_t most = (std::size_t{1} << 29) - 1;
    MessageBuilder message;
    message.allocate(2);
    EXPECT_EQ(failureOf([&] { message.allocate(most - 1); }),
              "too large: the parts of a message do not reach each other any more");
    EXPECT_EQ(failureOf([&] { Wire::Compact::writeList(message, 0, ElementSize::Byte, most + 1); }),
              "too large: a list of 536870912 elements does not fit into a message");
    EXPECT_EQ(failureOf([&] {
                  Wire::Compact::writeStructList(message, 0, {2, 2}, most / 2);
              }),
              "too large: a list of 1073741820 elements does not fit into a message");
    EXPECT_EQ(message.words().size(), 2U);
}

} // namespace

} // namespace CompactTest
