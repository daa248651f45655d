// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <new>
#include <string_view>
#include <type_traits>

namespace LumoClient {

/// Memory of one result: records and texts of any number in a few blocks, given back at once. Blocks grow with what is
/// already there, by an eighth, so that little is ever left over (the standard's monotonic resource doubles); a large
/// result lies in huge pages, the last of which is cut where the result ends.
class Arena {
public:
    Arena() = default;
    ~Arena();
    Arena(Arena const &) = delete;
    Arena &operator=(Arena const &) = delete;

    /// @throw std::bad_alloc
    void *allocate(std::size_t bytes, std::size_t alignment) {
        std::size_t const gap = (alignment - reinterpret_cast<std::uintptr_t>(next_) % alignment) % alignment;
        if (next_ == nullptr || gap > left_ || bytes > left_ - gap) {
            return allocateInNewBlock(bytes, alignment);
        }
        std::byte *result = next_ + gap;
        next_ = result + bytes;
        left_ -= gap + bytes;
        return result;
    }

    /// Records, all zero. They have nothing to destroy.
    template <typename Record>
    Record *records(std::size_t count) {
        static_assert(std::is_trivially_destructible_v<Record> && std::is_trivially_copyable_v<Record>);
        // NOLINTNEXTLINE(bugprone-sizeof-expression): a record may be a pointer
        return new (allocate(count * sizeof(Record), alignof(Record))) Record[count]();
    }

    /// The same for records that the caller is going to assign, each of them.
    template <typename Record>
    Record *unsetRecords(std::size_t count) {
        static_assert(std::is_trivially_destructible_v<Record> && std::is_trivially_copyable_v<Record>);
        // NOLINTNEXTLINE(bugprone-sizeof-expression): a record may be a pointer
        return static_cast<Record *>(allocate(count * sizeof(Record), alignof(Record)));
    }

    /// @param text of a message, behind which there is a NUL
    /// @return a copy, the NUL included
    char const *copy(std::string_view text) {
        if (text.empty()) {
            return "";
        }
        void *const place = allocate(text.size() + 1, 1);
        std::memcpy(place, text.data(), text.size() + 1);
        return static_cast<char const *>(place);
    }

    /// Gives back what is left of the last huge page. To be called when the result is complete.
    void trim();

private:
    void *allocateInNewBlock(std::size_t bytes, std::size_t alignment);

    struct Block {
        Block *previous;
        std::size_t mappedBytes; // 0: from the heap
    };

    Block *newest_ = nullptr;
    std::byte *next_ = nullptr;
    std::size_t left_ = 0;
    std::size_t total_ = 0;
};

/// A result of the C interface together with the memory that it points into. The caller sees the Result; its free
/// function gets it back and deletes the whole.
template <typename Result>
struct Owned : Result {
    Owned()
        : Result() {}
    static void free(Result *result) {
        delete static_cast<Owned *>(result);
    }
    Arena arena;
};

} // namespace LumoClient
