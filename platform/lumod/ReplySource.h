// SPDX-License-Identifier: Apache-2.0
//
// What answers a request: the content of one reply message, or of several for a long list. Messages are drawn one at a
// time, when the peer has taken the one before, so that a slow reader costs one message of memory.
#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <memory>
#include <utility>

#include "wire/Limits.h"
#include "wire/lumod.capnp.h"

namespace Lumod {

class ReplySource {
public:
    virtual ~ReplySource() = default;
    /// Fills the union of the next message.
    /// @return whether more messages follow
    virtual bool next(Wire::Reply::Builder reply) = 0;
    /// About how many bytes the next message's list takes. A message that fits its first segment is read without a
    /// look-up for each of its texts.
    virtual std::size_t nextBytes() const {
        return 0;
    }
};

using ReplyPtr = std::unique_ptr<ReplySource>;

/// A reply of one message.
ReplyPtr singleReply(std::function<void(Wire::Reply::Builder)> fill);
/// A reply that says that what was asked for is done.
ReplyPtr doneReply();

/// Where the chunk ends that begins with an element.
/// @param bytesOf about how many bytes an element takes: (index) -> size_t
/// @param bytes   set to about how many the chunk takes
template <typename BytesOf>
std::size_t endOfChunk(std::size_t first, std::size_t count, BytesOf const &bytesOf, std::size_t &bytes) {
    std::size_t end = first;
    for (bytes = 0; end < count && end - first < Wire::chunkElements; ++end) {
        std::size_t const more = bytesOf(end);
        if (bytes + more > Wire::chunkBytes && end > first) {
            break;
        }
        bytes += more;
    }
    return end;
}

/// Fills at most a chunk's worth of a list into one message.
/// @param first where the chunk begins among `count` elements
/// @param bytesOf about how many bytes an element takes: (index) -> size_t
/// @param init makes the list: (size) -> List::Builder
/// @param fill one element: (list, place, index)
/// @return the first element of the next chunk
template <typename BytesOf, typename Init, typename Fill>
std::size_t fillChunk(std::size_t first, std::size_t count, BytesOf const &bytesOf, Init const &init,
                      Fill const &fill) {
    std::size_t bytes = 0;
    std::size_t const end = endOfChunk(first, count, bytesOf, bytes);
    auto list = init(static_cast<unsigned>(end - first));
    for (std::size_t index = first; index < end; ++index) {
        fill(list, static_cast<unsigned>(index - first), index);
    }
    return end;
}

/// A reply that is one list, in as many messages as it takes; an empty list takes one.
template <typename BytesOf, typename Init, typename Fill>
class ListReply : public ReplySource {
public:
    ListReply(std::size_t count, BytesOf bytesOf, Init init, Fill fill)
        : count_(count)
        , bytesOf_(std::move(bytesOf))
        , init_(std::move(init))
        , fill_(std::move(fill)) {}

    bool next(Wire::Reply::Builder reply) override {
        at_ = fillChunk(
            at_, count_, bytesOf_, [this, &reply](unsigned size) { return init_(reply, size); }, fill_);
        return at_ < count_;
    }
    std::size_t nextBytes() const override {
        std::size_t bytes = 0;
        endOfChunk(at_, count_, bytesOf_, bytes);
        return bytes;
    }

private:
    std::size_t count_;
    std::size_t at_ = 0;
    BytesOf bytesOf_;
    Init init_;
    Fill fill_;
};

/// @param init (Reply::Builder, size) -> List::Builder; the rest as for fillChunk
template <typename BytesOf, typename Init, typename Fill>
ReplyPtr listReply(std::size_t count, BytesOf bytesOf, Init init, Fill fill) {
    return std::make_unique<ListReply<BytesOf, Init, Fill>>(count, std::move(bytesOf), std::move(init),
                                                            std::move(fill));
}

} // namespace Lumod
