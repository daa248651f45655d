// SPDX-License-Identifier: Apache-2.0
#include "RowStore.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

#include <boost/make_shared.hpp>
#include <sys/mman.h>

namespace Plexa::MetaObj {

namespace {

constexpr std::size_t leastBlock = 512;
constexpr std::size_t hugePage = std::size_t{2} << 20;
/// Blocks double with what there is up to this; from here on they are huge pages, one fault instead of 512.
constexpr std::size_t smallTotal = std::size_t{256} << 10;
/// What is larger gains nothing by being copied.
constexpr std::size_t largestRow = 4096;

std::size_t roundedUp(std::size_t bytes, std::size_t unit) {
    return (bytes + unit - 1) / unit * unit;
}

} // namespace

RowStore::~RowStore() {
    if (block_ != nullptr) {
        block_->release();
    }
}

void RowStore::Block::release() {
    if (users.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        bool const huge = isHuge;
        this->~Block();
        huge ? std::free(this) : ::operator delete(this);
    }
}

void RowStore::take(MetaStruct &row) {
    if (row.loose_ == nullptr || row.loose_->count == 0) {
        return;
    }
    MetaStruct::Loose &loose = *row.loose_;
    if (!isLike(loose)) {
        // The first row of a list may be the odd one.
        if (shape_ != nullptr && ++other_ <= taken_) {
            return;
        }
        adopt(loose);
    }
    std::size_t textBytes = 0;
    for (std::size_t i = 0; i < loose.count; ++i) {
        textBytes += loose.columns[i].held == MetaStruct::Held::Text ? loose.cells[i].text.size_ : 0;
    }
    std::size_t const cellBytes = sizeof(MetaStruct::Packed) + loose.count * sizeof(MetaStruct::Cell);
    if (cellBytes + textBytes > largestRow) {
        return;
    }
    std::byte *const room = allocate(roundedUp(cellBytes + textBytes, alignof(std::max_align_t) / 2));
    auto *const packed = new (room) MetaStruct::Packed{block_};
    char *text = reinterpret_cast<char *>(room + cellBytes);
    for (std::size_t i = 0; i < loose.count; ++i) {
        MetaStruct::Cell &from = loose.cells[i];
        auto *const to = new (packed->cells() + i) MetaStruct::Cell;
        switch (loose.columns[i].held) {
        case MetaStruct::Held::Text:
            new (&to->text) MetaString;
            to->text.set_ = from.text.set_;
            to->text.size_ = from.text.size_;
            to->text.text_ = text;
            std::memcpy(text, from.text.text_, from.text.size_);
            text += from.text.size_;
            break;
        case MetaStruct::Held::Number:
            new (&to->number) MetaInt(from.number);
            break;
        case MetaStruct::Held::Truth:
            new (&to->truth) MetaBool(from.truth);
            break;
        case MetaStruct::Held::Object:
            new (&to->object) boost::shared_ptr<MetaObject>(std::move(from.object));
        }
    }
    block_->users.fetch_add(1, std::memory_order_relaxed);
    ++taken_;
    row.packed_ = packed;
    delete std::exchange(row.loose_, nullptr);
}

bool RowStore::isLike(MetaStruct::Loose const &row) const {
    if (shape_ == nullptr || shape_->columns.size() != row.count || shape_->name != row.name) {
        return false;
    }
    return std::equal(row.columns, row.columns + row.count, shape_->columns.begin(),
                      [](MetaStruct::Column const &left, MetaStruct::Column const &right) {
                          return left.held == right.held && left.name == right.name;
                      });
}

void RowStore::adopt(MetaStruct::Loose const &row) {
    auto shape = boost::make_shared<Shape>();
    shape->name = row.name;
    shape->columns.assign(row.columns, row.columns + row.count);
    shape->holdsObjects =
        std::any_of(shape->columns.begin(), shape->columns.end(),
                    [](MetaStruct::Column const &column) { return column.held == MetaStruct::Held::Object; });
    shape_ = std::move(shape);
    left_ = 0;
    taken_ = other_ = 0;
}

std::byte *RowStore::allocate(std::size_t bytes) {
    if (bytes > left_) {
        beginBlock();
    }
    std::byte *const room = next_;
    next_ += bytes;
    left_ -= bytes;
    return room;
}

void RowStore::beginBlock() {
    bool const isHuge = total_ >= smallTotal;
    std::size_t const size = isHuge ? hugePage : std::clamp(total_, leastBlock, smallTotal) + largestRow;
    void *const room = isHuge ? std::aligned_alloc(hugePage, hugePage) : ::operator new(size);
    if (room == nullptr) {
        throw std::bad_alloc();
    }
    if (isHuge) {
        madvise(room, hugePage, MADV_HUGEPAGE);
    }
    auto *const block = new (room) Block(shape_);
    block->isHuge = isHuge;
    if (Block *const before = std::exchange(block_, block); before != nullptr) {
        before->release();
    }
    constexpr std::size_t head =
        (sizeof(Block) + alignof(std::max_align_t) - 1) / alignof(std::max_align_t) * alignof(std::max_align_t);
    next_ = static_cast<std::byte *>(room) + head;
    left_ = size - head;
    total_ += size;
}

} // namespace Plexa::MetaObj
