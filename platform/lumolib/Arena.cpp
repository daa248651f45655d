// SPDX-License-Identifier: Apache-2.0
#include "Arena.h"

#include <algorithm>

namespace LumoClient {

namespace {

constexpr std::size_t leastBlock = 512;
constexpr std::size_t largestBlock = std::size_t{1} << 20;
/// The next block is this part of what there is.
constexpr std::size_t growth = 8;

} // namespace

Arena::~Arena() {
    while (newest_ != nullptr) {
        Block *block = newest_;
        newest_ = block->previous;
        ::operator delete(block);
    }
}

void *Arena::allocateInNewBlock(std::size_t bytes, std::size_t alignment) {
    std::size_t const size =
        std::max(sizeof(Block) + bytes + alignment, std::clamp(total_ / growth, leastBlock, largestBlock));
    newest_ = new (::operator new(size)) Block{newest_};
    next_ = reinterpret_cast<std::byte *>(newest_) + sizeof(Block);
    left_ = size - sizeof(Block);
    total_ += size;
    return allocate(bytes, alignment);
}

} // namespace LumoClient
