// SPDX-License-Identifier: Apache-2.0
#include "FileSystemBlock.h"

#include <algorithm>
#include <new>
#include <utility>

#include "LumoFileSystem.h"

namespace Kestrel {
namespace {

/// Few containers are the rule; their block should not touch more memory than they need.
constexpr std::size_t firstBlockBytes = 2048;
constexpr std::size_t largestBlockBytes = 32768;

} // namespace

FileSystemBlock *FileSystemBlock::make(std::shared_ptr<Host> host, std::size_t bytes) {
    void *const memory = ::operator new(sizeof(FileSystemBlock) + bytes);
    return ::new (memory) FileSystemBlock(std::move(host), bytes);
}

FileSystemBlock::FileSystemBlock(std::shared_ptr<Host> host, std::size_t bytes) noexcept
    : host_(std::move(host))
    , free_(reinterpret_cast<std::byte *>(this + 1))
    , end_(free_ + bytes) {
    static_assert(alignof(LumoFileSystem) <= alignof(FileSystemBlock));
}

std::size_t FileSystemBlock::roomFor(std::string_view name) noexcept {
    constexpr std::size_t alignment = alignof(LumoFileSystem);
    return sizeof(LumoFileSystem) + (name.size() + alignment - 1) / alignment * alignment;
}

LumoFileSystem *FileSystemBlock::add(std::string_view name, std::string_view containerId) noexcept {
    std::size_t const room = roomFor(name);
    if (static_cast<std::size_t>(end_ - free_) < room) {
        return nullptr;
    }
    char *const ownName = reinterpret_cast<char *>(free_ + sizeof(LumoFileSystem));
    std::copy(name.begin(), name.end(), ownName);
    auto *const fileSystem = ::new (free_) LumoFileSystem(*this, {ownName, name.size()}, containerId);
    free_ += room;
    // Nobody else has the block before it is full, so that no other count can come between.
    holders_.store(holders_.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
    return fileSystem;
}

void FileSystemBlock::letGo() noexcept {
    if (holders_.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        this->~FileSystemBlock();
        ::operator delete(this);
    }
}

FileSystemMaker::FileSystemMaker(std::shared_ptr<Host> host)
    : host_(std::move(host))
    , nextBytes_(firstBlockBytes) {}

std::unique_ptr<LumoFileSystem> FileSystemMaker::make(std::string_view name, std::string_view containerId) {
    LumoFileSystem *made = block_ ? block_->add(name, containerId) : nullptr;
    if (made == nullptr) {
        block_.reset(FileSystemBlock::make(host_, std::max(nextBytes_, FileSystemBlock::roomFor(name))));
        nextBytes_ = std::min(nextBytes_ * 4, largestBlockBytes);
        made = block_->add(name, containerId);
    }
    return std::unique_ptr<LumoFileSystem>(made);
}

std::unique_ptr<LumoFileSystem> FileSystemMaker::makeOne(std::shared_ptr<Host> host, std::string_view name,
                                                         std::string_view containerId) {
    Held const block(FileSystemBlock::make(std::move(host), FileSystemBlock::roomFor(name)));
    return std::unique_ptr<LumoFileSystem>(block->add(name, containerId));
}

} // namespace Kestrel
