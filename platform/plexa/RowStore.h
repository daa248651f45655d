// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/MetaObj.h"

namespace Plexa::MetaObj {

/// A structure on its own. Two fields with short texts, and the structure that a command is about to append to a list
/// has hardly more, need nothing beside it; more of them lie in room that grows.
struct MetaStruct::Loose {
    explicit Loose(std::string const &structureName)
        : name(structureName)
        , columns(reinterpret_cast<Column *>(firstColumns))
        , cells(reinterpret_cast<Cell *>(firstCells)) {}
    ~Loose();
    Loose(Loose const &) = delete;
    Loose &operator=(Loose const &) = delete;

    /// Makes a value where there is none, from one that is to be destroyed next.
    static void move(Cell &to, Cell &from, Held held);
    static void destroy(Cell &cell, Held held);

    /// @return the field's place, or the count
    std::size_t find(std::string const &field) const;
    /// Room for so many fields.
    void grow(std::size_t fields);
    /// Lets go of a block of columns and cells, if it is one.
    void drop(Column *block);
    /// Room for a text among the first ones; null when there is no more.
    char *roomFor(std::size_t bytes);

    static constexpr std::size_t firstCapacity = 2;
    static constexpr std::size_t firstTextBytes = 64;

    std::string name;
    std::size_t count = 0;
    std::size_t capacity = firstCapacity;
    Column *columns;
    Cell *cells; // in one block with the columns, behind them, or both in the first ones
    std::size_t textBytes = 0;
    alignas(Column) std::byte firstColumns[firstCapacity * sizeof(Column)];
    alignas(Cell) std::byte firstCells[firstCapacity * sizeof(Cell)];
    char firstTexts[firstTextBytes];
};

/// Where the values of a list's structures lie. A long list holds rows that were all made alike, so their names are
/// kept once, and values and texts lie one behind the other in blocks; a row has nothing allocated for itself but the
/// object that others point to. A block lives as long as a row in it, which may be longer than the list. What is in a
/// block is not changed any more: a row that is set or asked for a value leaves it.
class RowStore {
public:
    RowStore() = default;
    ~RowStore();
    RowStore(RowStore const &) = delete;
    RowStore &operator=(RowStore const &) = delete;

    /// Takes a structure in, if it is like the others. One that is not, or is large, stays as it is.
    void take(MetaStruct &row);

    struct Shape {
        std::string name;
        std::vector<MetaStruct::Column> columns;
        bool holdsObjects = false;
    };

    /// One block's head; rows follow.
    struct Block {
        explicit Block(boost::shared_ptr<Shape const> sharedShape)
            : shape(std::move(sharedShape)) {}
        /// To be called by a row, and by the store, when it needs the block no more. Rows of one list may be on several
        /// threads.
        void release();

        boost::shared_ptr<Shape const> shape;
        std::atomic<std::size_t> users{1};
        bool isHuge = false;
    };

private:
    bool isLike(MetaStruct::Loose const &row) const;
    void adopt(MetaStruct::Loose const &row);
    std::byte *allocate(std::size_t bytes);
    void beginBlock();

    boost::shared_ptr<Shape const> shape_;
    Block *block_ = nullptr;
    std::byte *next_ = nullptr;
    std::size_t left_ = 0;
    std::size_t total_ = 0;
    std::size_t taken_ = 0; // rows of the shape
    std::size_t other_ = 0; // rows that were not
};

/// A structure's place in a block.
struct MetaStruct::Packed {
    RowStore::Block *block;

    Cell *cells() {
        static_assert(sizeof(Packed) % alignof(Cell) == 0);
        return reinterpret_cast<Cell *>(this + 1);
    }
    /// Of the structure, which leaves.
    void leave();
};

} // namespace Plexa::MetaObj
