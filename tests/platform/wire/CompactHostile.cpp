// SPDX-License-Identifier: Apache-2.0
//
// Messages that lie. The compact reader refuses what the library refuses and reads what the library reads, and under
// the sanitizers nothing outside of the body is touched.
#include <gtest/gtest.h>

#include "CompactFixture.h"

namespace CompactTest {

namespace {

using Wire::Compact::ElementSize;
using Wire::Compact::Pointer;
using Wire::Compact::StructSize;

std::vector<std::uint8_t> someChoices() {
    std::vector<std::uint8_t> bytes(400);
    std::uint32_t state = 12345;
    for (std::uint8_t &byte : bytes) {
        state = state * 1664525 + 1013904223;
        byte = static_cast<std::uint8_t>(state >> 24);
    }
    return bytes;
}

/// A sample of each kind of reply, in one segment and in many.
std::vector<Segments> sampleReplies() {
    std::vector<Segments> samples;
    for (unsigned kind = 0; kind + 1 < BothApis::replyKinds; ++kind) {
        for (unsigned const firstSegment : {0U, 16U}) {
            capnp::MallocMessageBuilder message(firstSegment, firstSegment > 0 ? capnp::AllocationStrategy::FIXED_SIZE
                                                                               : capnp::SUGGESTED_ALLOCATION_STRATEGY);
            BothApis::fill(message.initRoot<Wire::Reply>(), kind, BothApis::Choices(someChoices()));
            samples.push_back(segmentsOf(message));
        }
    }
    return samples;
}

/// Both readings of a reply, which must be one.
std::string read(Segments const &segments) {
    std::string const compact = compactPrint<Wire::Compact::Reply>(segments);
    EXPECT_EQ(compact, libraryPrint<Wire::Reply>(segments));
    return compact;
}

std::uint64_t structTo(std::int64_t offset, StructSize size) {
    return Pointer::toStruct(offset, size).bits();
}

std::uint64_t listTo(std::int64_t offset, ElementSize size, std::uint64_t count) {
    return Pointer::toList(offset, size, count).bits();
}

std::uint64_t farTo(std::uint32_t segment, std::uint32_t place, bool twice = false) {
    return Pointer::Far | (twice ? 4U : 0U) | std::uint64_t{place} << 3 | std::uint64_t{segment} << 32;
}

/// Segment 0 up to a reply's one pointer, which comes next.
std::vector<std::uint64_t> replyOf(std::uint16_t kind, std::uint64_t pointer) {
    return {structTo(0, {2, 1}), 1, std::uint64_t{kind} << 16, pointer};
}

std::vector<std::uint64_t> joined(std::vector<std::uint64_t> words, std::vector<std::uint64_t> const &more) {
    words.insert(words.end(), more.begin(), more.end());
    return words;
}

} // namespace

TEST(CompactHostile, every_truncation_is_read_as_the_library_reads_it) {
    int refused = 0;
    for (Segments const &sample : sampleReplies()) {
        for (std::size_t segment = 0; segment < sample.size(); ++segment) {
            for (std::size_t words = segment == 0 ? 1 : 0; words < sample[segment].size(); ++words) {
                Segments cut = sample;
                cut[segment].resize(words);
                refused += read(cut) == "malformed" ? 1 : 0;
            }
        }
    }
    EXPECT_GT(refused, 100);
}

TEST(CompactHostile, every_changed_byte_is_read_as_the_library_reads_it) {
    int refused = 0;
    for (Segments const &sample : sampleReplies()) {
        for (std::size_t segment = 0; segment < sample.size(); ++segment) {
            for (std::size_t byte = 0; byte < 8 * sample[segment].size(); ++byte) {
                for (std::uint64_t const mask : {0x01U, 0x02U, 0x04U, 0x10U, 0x80U, 0xFFU}) {
                    Segments changed = sample;
                    changed[segment][byte / 8] ^= mask << 8 * (byte % 8);
                    refused += read(changed) == "malformed" ? 1 : 0;
                }
            }
        }
    }
    EXPECT_GT(refused, 1000);
}

TEST(CompactHostile, nesting_past_the_limit_is_refused) {
    class Chain : public Wire::Compact::StructReader {
    public:
        explicit Chain(StructReader const &place)
            : StructReader(place) {}
        bool more() const {
            return hasPointer(0);
        }
        Chain next() const {
            return structure<Chain>(0);
        }
    };
    struct Root {
        using Reader = Chain;
    };
    Segments const endless{std::vector<std::uint64_t>(1000, structTo(0, {0, 1}))};
    Wire::Compact::MessageReader reader(tableOf(endless), endless[0].data());
    Chain place = reader.getRoot<Root>();
    int depth = 1;
    EXPECT_THROW(
        for (; place.more(); ++depth) { place = place.next(); }, Wire::Compact::Malformed);
    EXPECT_EQ(depth, Wire::nestingMax);
}

TEST(CompactHostile, a_structure_that_holds_itself_is_no_endless_one) {
    // The failure's sentence points back at the reply; as a text that is refused, as a structure it would be a loop.
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::FAILURE, structTo(0, {1, 1})), {7, structTo(-6, {2, 1})})}),
              "malformed");
    // A reply that is its own failure.
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, structTo(-3, {2, 1}))}), "malformed");
}

TEST(CompactHostile, many_pointers_to_one_text_are_refused_when_they_multiply_it) {
    // 200 names, all of them the same 8000 bytes.
    std::vector<std::uint64_t> words = replyOf(Wire::Reply::CONTAINER_NAMES, listTo(0, ElementSize::Pointer, 200));
    for (std::int64_t name = 0; name < 200; ++name) {
        words.push_back(listTo(199 - name, ElementSize::Byte, 8000));
    }
    words.resize(words.size() + 1000, 0);
    EXPECT_EQ(read({words}), "malformed");
    // Four visits of each word are allowed.
    words = replyOf(Wire::Reply::CONTAINER_NAMES, listTo(0, ElementSize::Pointer, 3));
    for (std::int64_t name = 0; name < 3; ++name) {
        words.push_back(listTo(2 - name, ElementSize::Byte, 8000));
    }
    words.resize(words.size() + 1000, 0);
    EXPECT_NE(read({words}), "malformed");
}

TEST(CompactHostile, lists_of_nothing_are_refused_when_they_claim_to_be_long) {
    constexpr std::uint64_t most = (std::uint64_t{1} << 29) - 1;
    EXPECT_EQ(read({replyOf(Wire::Reply::METADATA, listTo(0, ElementSize::Void, most))}), "malformed");
    std::uint64_t const emptyTag = Pointer::tag(most, {0, 0}).bits();
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::METADATA, listTo(0, ElementSize::Composite, 0)), {emptyTag})}),
              "malformed");
    EXPECT_NE(read({replyOf(Wire::Reply::METADATA, listTo(0, ElementSize::Void, 3))}), "malformed");
}

TEST(CompactHostile, the_last_visit_that_is_allowed_is_the_librarys) {
    // Five words, each of which may be visited four times: the root's pointer twice, the reply's three, and the
    // elements.
    EXPECT_NE(read({joined(replyOf(Wire::Reply::STORAGE_ARRAYS, listTo(0, ElementSize::Void, 15)), {0})}), "malformed");
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::STORAGE_ARRAYS, listTo(0, ElementSize::Void, 16)), {0})}), "malformed");
}

TEST(CompactHostile, huge_lists_are_refused) {
    constexpr std::uint64_t most = (std::uint64_t{1} << 29) - 1;
    for (std::uint64_t size = 0; size < 8; ++size) {
        for (std::uint16_t kind = 0; kind + 1U < BothApis::replyKinds; ++kind) {
            read({joined(replyOf(kind, listTo(0, static_cast<ElementSize>(size), most)), {0, 0})});
        }
    }
    // A tag whose elements times their size does not fit into 32 bits.
    std::uint64_t const tag = Pointer::tag(0x3FFFFFFF, {0xFFFF, 0xFFFF}).bits();
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::METADATA, listTo(0, ElementSize::Composite, 1)), {tag, 0})}),
              "malformed");
}

TEST(CompactHostile, lists_that_grew_are_read_and_others_refused) {
    std::uint64_t const text = std::uint64_t{'A'};
    // Numbers and texts where structures, and structures where numbers and texts were meant.
    for (std::uint64_t size = 0; size < 7; ++size) {
        for (std::uint16_t kind = 0; kind + 1U < BothApis::replyKinds; ++kind) {
            read({joined(replyOf(kind, listTo(0, static_cast<ElementSize>(size), 1)),
                         {listTo(0, ElementSize::Byte, 2), text})});
        }
    }
    for (StructSize const size : {StructSize{0, 1}, StructSize{1, 0}, StructSize{1, 1}, StructSize{0, 0}}) {
        for (std::uint16_t kind = 0; kind + 1U < BothApis::replyKinds; ++kind) {
            std::vector<std::uint64_t> words =
                joined(replyOf(kind, listTo(0, ElementSize::Composite, size.words())), {Pointer::tag(1, size).bits()});
            words.resize(words.size() + size.dataWords, 77);
            words.resize(words.size() + size.pointerCount, listTo(0, ElementSize::Byte, 2));
            words.push_back(text);
            read({words});
        }
    }
    EXPECT_NE(read({joined(replyOf(Wire::Reply::METADATA, listTo(0, ElementSize::Pointer, 1)),
                           {listTo(0, ElementSize::Byte, 2), text})})
                  .find("\"A\""),
              std::string::npos);
}

TEST(CompactHostile, far_pointers_lead_somewhere_or_are_refused) {
    std::vector<std::uint64_t> const landing = {structTo(0, {1, 1}), 5, 0};
    EXPECT_NE(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0)), landing}), "malformed");
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(2, 0)), landing}), "malformed") << "no such segment";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 3)), landing}), "malformed") << "behind the segment";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0x1FFFFFFF)), landing}), "malformed");
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0)), {farTo(1, 0)}}), "malformed") << "a pad that is far";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(0, 3))}), "malformed") << "its own pad";

    std::vector<std::uint64_t> const pad = {farTo(2, 0), structTo(0, {1, 1})};
    EXPECT_NE(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0, true)), pad, {5, 0}}), "malformed");
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0, true)), pad, {5}}), "malformed") << "too short";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0, true)), pad}), "malformed") << "no such segment";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 1, true)), pad, {5, 0}}), "malformed") << "half a pad";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0, true)), landing, {5, 0}}), "malformed") << "no far pad";
    EXPECT_EQ(read({replyOf(Wire::Reply::FAILURE, farTo(1, 0, true)), {structTo(0, {1, 0}), pad[1]}, {5, 0}}),
              "malformed")
        << "a structure that looks like the number of a segment";
}

TEST(CompactHostile, texts_without_an_end_are_refused) {
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::FAILURE, structTo(0, {1, 1})),
                           {5, listTo(0, ElementSize::Byte, 8), 0x4141414141414141})}),
              "malformed");
    EXPECT_EQ(read({joined(replyOf(Wire::Reply::FAILURE, structTo(0, {1, 1})), {5, listTo(0, ElementSize::Byte, 0)})}),
              "malformed");
}

} // namespace CompactTest
