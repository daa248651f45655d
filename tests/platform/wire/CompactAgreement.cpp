// SPDX-License-Identifier: Apache-2.0
//
// The compact messages and the library's say the same thing, in both directions, about every kind of message.
#include <capnp/schema.h>
#include <gtest/gtest.h>
#include <rapidcheck.h>

#include "CompactFixture.h"

namespace CompactTest {

namespace {

using Bytes = std::vector<std::uint8_t>;

/// Many bytes also for small cases: a message takes up to a hundred.
rc::Gen<Bytes> bytes() {
    return rc::gen::container<Bytes>(300, rc::gen::arbitrary<std::uint8_t>());
}

template <typename LibraryStruct, typename CompactStruct>
void agree(unsigned kind, Bytes const &choices, unsigned firstSegmentWords) {
    // Tiny segments make far and double-far pointers.
    capnp::MallocMessageBuilder library(firstSegmentWords, firstSegmentWords > 0
                                                               ? capnp::AllocationStrategy::FIXED_SIZE
                                                               : capnp::SUGGESTED_ALLOCATION_STRATEGY);
    BothApis::fill(library.initRoot<LibraryStruct>(), kind, BothApis::Choices(choices));
    Wire::Compact::MessageBuilder compact;
    BothApis::fill(compact.initRoot<CompactStruct>(), kind, BothApis::Choices(choices));
    Segments const byLibrary = segmentsOf(library);
    Segments const byCompact = segmentsOf(compact);
    std::string const expected = libraryPrint<LibraryStruct>(byLibrary);

    RC_ASSERT(expected != "malformed");
    RC_ASSERT(libraryPrint<LibraryStruct>(byCompact) == expected);
    RC_ASSERT(compactPrint<CompactStruct>(byCompact) == expected);
    if (byLibrary.size() <= Wire::segmentCountMax) {
        RC_ASSERT(compactPrint<CompactStruct>(byLibrary) == expected);
    }
}

} // namespace

TEST(CompactAgreement, requests_of_every_kind_mean_the_same_on_both_sides) {
    EXPECT_TRUE(rc::check([] {
        Bytes const choices = *bytes();
        unsigned const firstSegment = *rc::gen::element(0U, 8U, 16U);
        for (unsigned kind = 0; kind + 1 < BothApis::requestKinds; ++kind) {
            agree<Wire::Request, Wire::Compact::Request>(kind, choices, firstSegment);
        }
    }));
}

TEST(CompactAgreement, replies_of_every_kind_mean_the_same_on_both_sides) {
    EXPECT_TRUE(rc::check([] {
        Bytes const choices = *bytes();
        unsigned const firstSegment = *rc::gen::element(0U, 8U, 16U);
        for (unsigned kind = 0; kind + 1 < BothApis::replyKinds; ++kind) {
            agree<Wire::Reply, Wire::Compact::Reply>(kind, choices, firstSegment);
        }
    }));
}

TEST(CompactAgreement, a_message_of_nothing_has_the_defaults) {
    for (Segments const &segments : {Segments{{0}}, Segments{{0xFFFFFFFC}}}) { // no root, and a root of no size
        std::string const expected = libraryPrint<Wire::Reply>(segments);
        EXPECT_NE(expected.find("yes"), std::string::npos) << "a reply is the last one unless it says otherwise";
        EXPECT_EQ(compactPrint<Wire::Compact::Reply>(segments), expected);
        EXPECT_EQ(compactPrint<Wire::Compact::Request>(segments), libraryPrint<Wire::Request>(segments));
    }
}

TEST(CompactAgreement, the_numbers_of_kinds_are_those_of_the_schema) {
    EXPECT_EQ(BothApis::requestKinds, capnp::Schema::from<Wire::Request>().getUnionFields().size() + 1);
    EXPECT_EQ(BothApis::replyKinds, capnp::Schema::from<Wire::Reply>().getUnionFields().size() + 1);
}

TEST(CompactAgreement, a_text_of_any_size_is_carried) {
    std::string const text(300000, 'x');
    Wire::Compact::MessageBuilder message;
    Wire::Compact::Request::Builder request = message.initRoot<Wire::Compact::Request>();
    request.setTraceId(text);
    request.setPing();
    EXPECT_NE(libraryPrint<Wire::Request>(segmentsOf(message)).find(text), std::string::npos);
}

} // namespace CompactTest
