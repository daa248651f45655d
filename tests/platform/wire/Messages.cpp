// SPDX-License-Identifier: Apache-2.0
//
// Bodies that lie about themselves, read as both ends read them.
#include <cstdint>
#include <vector>

#include <capnp/any.h>
#include <capnp/message.h>
#include <capnp/serialize.h>

#include "wire/Limits.h"
#include "wire/MessageBuffer.h"
#include "wire/lumod.capnp.h"

#include <gtest/gtest.h>

namespace {

std::uint64_t structPointer(std::uint32_t offset, std::uint16_t dataWords, std::uint16_t pointers) {
    return (std::uint64_t{offset} << 2) | (std::uint64_t{dataWords} << 32) | (std::uint64_t{pointers} << 48);
}

std::uint64_t listPointer(std::uint32_t offset, unsigned elementSize, std::uint32_t elements) {
    return 1 | (std::uint64_t{offset} << 2) | (std::uint64_t{elementSize} << 32) | (std::uint64_t{elements} << 35);
}

class Body {
public:
    explicit Body(std::vector<std::uint64_t> words)
        : words_(std::move(words))
        , segment_(kj::arrayPtr(reinterpret_cast<capnp::word const *>(words_.data()), words_.size()))
        , reader_(kj::arrayPtr(&segment_, 1), Wire::readerOptions(8 * words_.size())) {}

    capnp::MessageReader &reader() {
        return reader_;
    }

private:
    std::vector<std::uint64_t> words_;
    kj::ArrayPtr<capnp::word const> segment_;
    capnp::SegmentArrayMessageReader reader_;
};

/// How deep one gets along the first pointers before it is refused.
int depthReached(capnp::MessageReader &reader) {
    int depth = 0;
    try {
        capnp::AnyPointer::Reader pointer = reader.getRoot<capnp::AnyPointer>();
        for (; !pointer.isNull(); ++depth) {
            pointer = pointer.getAs<capnp::AnyStruct>().getPointerSection()[0];
        }
    } catch (kj::Exception const &) {
        return depth;
    }
    return -depth;
}

TEST(Messages, fault_19_nesting_past_the_limit_is_refused) {
    std::vector<std::uint64_t> chain(1000, structPointer(0, 0, 1));
    Body body(chain);
    EXPECT_EQ(depthReached(body.reader()), Wire::nestingMax);
}

TEST(Messages, nesting_within_the_limit_is_read) {
    std::vector<std::uint64_t> chain(Wire::nestingMax, structPointer(0, 0, 1));
    chain.push_back(0);
    Body body(chain);
    EXPECT_EQ(depthReached(body.reader()), -Wire::nestingMax);
}

/// A metadata reply whose list is whatever the pointer says. Reply: 2 data words (id; last and discriminant), 1
/// pointer.
std::vector<std::uint64_t> metadataReply(std::uint64_t list) {
    std::uint64_t const last = 0;
    std::uint64_t const which = std::uint64_t{Wire::Reply::METADATA} << 16;
    return {structPointer(0, 2, 1), 1, last | which, list};
}

TEST(Messages, fault_20_a_count_beyond_the_body_is_refused) {
    std::vector<std::uint64_t> words = metadataReply(listPointer(0, 7, 0x1FFFFFFF));
    words.push_back(structPointer(0x1FFFFFFF, 0, 2));
    Body body(words);
    Wire::Reply::Reader const reply = body.reader().getRoot<Wire::Reply>();
    ASSERT_EQ(reply.which(), Wire::Reply::METADATA);
    EXPECT_THROW(reply.getMetadata(), kj::Exception);
}

TEST(Messages, fault_20_a_count_times_size_that_overflows_is_refused) {
    // A list of one word of content whose tag claims 2^29 - 1 elements of 65535 words each.
    std::vector<std::uint64_t> words = metadataReply(listPointer(0, 7, 1));
    words.push_back(structPointer(0x1FFFFFFF, 0xFFFF, 0));
    words.push_back(0);
    Body body(words);
    EXPECT_THROW(body.reader().getRoot<Wire::Reply>().getMetadata(), kj::Exception);
}

TEST(Messages, fault_20_many_elements_without_content_are_refused) {
    std::vector<std::uint64_t> words = metadataReply(listPointer(0, 7, 0));
    words.push_back(structPointer(0x1FFFFFFF, 0, 0));
    Body body(words);
    EXPECT_THROW(body.reader().getRoot<Wire::Reply>().getMetadata(), kj::Exception);
}

TEST(Messages, one_text_that_many_pointers_name_is_not_multiplied) {
    capnp::MallocMessageBuilder message(20000); // words; one segment holds it all
    capnp::List<capnp::Text>::Builder names = message.initRoot<Wire::Reply>().initContainerNames(100);
    names.set(0, std::string(80000, 'x').c_str());
    kj::Array<capnp::word> const flat = capnp::messageToFlatArray(message);
    auto const *begin = reinterpret_cast<std::uint64_t const *>(flat.begin() + 1);
    std::vector<std::uint64_t> words(begin, begin + flat.size() - 1);
    // The list's elements follow the reply: pointer, 2 data words, list pointer. Each next one points a word less far.
    std::size_t const first = 4;
    for (std::size_t place = 1; place < 100; ++place) {
        words[first + place] = words[first] - (place << 2);
    }
    Body body(words);
    capnp::List<capnp::Text>::Reader const read = body.reader().getRoot<Wire::Reply>().getContainerNames();
    EXPECT_EQ(read[0].size(), 80000U);
    EXPECT_EQ(read[1].size(), 80000U);
    EXPECT_THROW(
        {
            for (capnp::Text::Reader const name : read) {
                ASSERT_EQ(name.size(), 80000U);
            }
        },
        kj::Exception);
}

} // namespace
