// SPDX-License-Identifier: Apache-2.0
//
// This program's allocator counts, so that a format can be held to what it may keep beside the result.
#include <algorithm>
#include <cstdlib>
#include <malloc.h>
#include <new>

#include <gtest/gtest.h>

#include "Samples.h"

namespace {

std::size_t held = 0;
std::size_t peak = 0;

void *allocate(std::size_t size) {
    void *const result = std::malloc(size > 0 ? size : 1);
    if (result == nullptr) {
        throw std::bad_alloc();
    }
    held += malloc_usable_size(result);
    peak = std::max(peak, held);
    return result;
}

void release(void *pointer) noexcept {
    held -= pointer != nullptr ? malloc_usable_size(pointer) : 0;
    std::free(pointer);
}

} // namespace

void *operator new(std::size_t size) {
    return allocate(size);
}

void *operator new[](std::size_t size) {
    return allocate(size);
}

void operator delete(void *pointer) noexcept {
    release(pointer);
}

void operator delete[](void *pointer) noexcept {
    release(pointer);
}

void operator delete(void *pointer, std::size_t) noexcept {
    release(pointer);
}

void operator delete[](void *pointer, std::size_t) noexcept {
    release(pointer);
}

namespace {

using namespace Samples;

/// Keeps nothing but the size of what came.
class CountingSink : public Plexa::Sink {
public:
    void write(std::string_view text) override {
        ++pieces;
        bytes += text.size();
        largest = std::max(largest, text.size());
    }

    std::size_t pieces = 0;
    std::size_t bytes = 0;
    std::size_t largest = 0;
};

Plexa::Result rows(std::size_t count) {
    std::vector<boost::shared_ptr<MetaStruct>> made;
    made.reserve(count);
    for (std::size_t i = 0; i < count; ++i) {
        std::string const number = std::to_string(i);
        made.push_back(container("container " + number + " \xE9\x87\x91", static_cast<int64_t>(i),
                                 {array("array-" + number, {"PE #0", "PE #1"})}));
    }
    return containers(made);
}

class FormatMemory : public testing::TestWithParam<char const *> {};

TEST_P(FormatMemory, WhatIsKeptDoesNotGrowWithTheResult) {
    Plexa::Result const result = rows(20000);
    Plexa::Format const &format = Plexa::requireFormat(GetParam(), "--format");
    for (std::size_t const width : {std::size_t{0}, std::size_t{40}}) {
        Plexa::FormatSettings formatting;
        formatting.setDisplay({width, true, false});
        CountingSink sink;
        std::size_t const before = held;
        peak = held;
        format.write(result, formatting, sink);
        EXPECT_LE(peak - before, 32U * 1024) << "for " << sink.bytes << " bytes of text";
        EXPECT_EQ(held, before);
        EXPECT_LE(sink.largest, 16U * 1024);
        EXPECT_GT(sink.pieces, 100U) << "written in the end, not on the way";
    }
}

INSTANTIATE_TEST_SUITE_P(, FormatMemory,
                         testing::Values("simple", "table", "tree", "json", "yaml", "xml", "csv", "keyvalue"),
                         [](auto const &each) { return std::string(each.param); });

} // namespace
