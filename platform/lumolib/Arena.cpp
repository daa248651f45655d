// SPDX-License-Identifier: Apache-2.0
#include "Arena.h"

#include <algorithm>

#include <sys/mman.h>
#include <unistd.h>

namespace LumoClient {

namespace {

constexpr std::size_t leastBlock = 512;
/// The next block is this part of what there is.
constexpr std::size_t growth = 8;
/// From here on blocks are huge pages.
constexpr std::size_t smallTotal = std::size_t{256} << 10;
constexpr std::size_t hugePage = std::size_t{2} << 20;

std::size_t roundedUp(std::size_t bytes, std::size_t unit) {
    return (bytes + unit - 1) / unit * unit;
}

/// Room that begins where a huge page does. One fault then brings in what would otherwise take 512, and the faults are
/// most of what an answer with 100,000 records costs. A kernel without huge pages brings in small ones as usual.
std::byte *mapHuge(std::size_t bytes) {
    std::size_t const reserved = bytes + hugePage;
    void *const place = mmap(nullptr, reserved, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (place == MAP_FAILED) {
        throw std::bad_alloc();
    }
    auto *const begin = static_cast<std::byte *>(place);
    std::size_t const before =
        roundedUp(reinterpret_cast<std::uintptr_t>(begin), hugePage) - reinterpret_cast<std::uintptr_t>(begin);
    if (before > 0) {
        munmap(begin, before);
    }
    munmap(begin + before + bytes, reserved - before - bytes);
    madvise(begin + before, bytes, MADV_HUGEPAGE);
    return begin + before;
}

} // namespace

Arena::~Arena() {
    while (newest_ != nullptr) {
        Block const block = *newest_;
        if (block.mappedBytes > 0) {
            munmap(newest_, block.mappedBytes);
        } else {
            ::operator delete(newest_);
        }
        newest_ = block.previous;
    }
}

void *Arena::allocateInNewBlock(std::size_t bytes, std::size_t alignment) {
    trim();
    std::size_t size = sizeof(Block) + bytes + alignment;
    if (total_ < smallTotal) {
        size = std::max(size, std::clamp(total_ / growth, leastBlock, smallTotal));
        newest_ = new (::operator new(size)) Block{newest_, 0};
    } else {
        size = roundedUp(size, hugePage);
        newest_ = new (mapHuge(size)) Block{newest_, size};
    }
    next_ = reinterpret_cast<std::byte *>(newest_) + sizeof(Block);
    left_ = size - sizeof(Block);
    total_ += size;
    return allocate(bytes, alignment);
}

void Arena::trim() {
    if (newest_ == nullptr || newest_->mappedBytes == 0) {
        return;
    }
    auto const pageSize = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
    std::size_t const used = newest_->mappedBytes - left_;
    std::size_t const kept = roundedUp(used, pageSize);
    if (kept < newest_->mappedBytes &&
        munmap(reinterpret_cast<std::byte *>(newest_) + kept, newest_->mappedBytes - kept) == 0) {
        newest_->mappedBytes = kept;
        left_ = kept - used;
    }
}

} // namespace LumoClient
