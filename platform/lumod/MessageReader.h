// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include <capnp/common.h>
#include <kj/common.h>

#include "ClientSocket.h"
#include "wire/MessageBuffer.h"
#include "wire/SegmentTable.h"

namespace Lumod {

/// Reads requests from a socket, one at a time. A short one, as nearly all are, is read where it has come, with one
/// system call; a long one gets room of its own. Nothing is allocated for a message before its table has passed the
/// check.
class MessageReader {
public:
    enum class Progress { Closed, Waiting, Whole };

    explicit MessageReader(ClientSocket &socket)
        : socket_(socket) {}

    /// Takes what has come, up to the end of the request.
    /// @return Whole as long as a request is there that was not dropped; Waiting only when the socket has no more;
    ///         Closed when the peer closed the connection after its last request
    /// @throws Wire::Failure ProtocolError, MessageTooLarge, ConnectionLost; the connection is of no further use then
    Progress advance();

    /// Whether a part of a request has come.
    bool hasBegun() const {
        return have_ > 0 || isLong_;
    }

    /// The request that is there whole; valid until it is dropped.
    kj::ArrayPtr<kj::ArrayPtr<capnp::word const> const> segments() const {
        return isLong_ ? buffer_.segments() : kj::arrayPtr(&onlySegment_, 1);
    }
    std::size_t bodyBytes() const {
        return isLong_ ? buffer_.bodyBytes() : onlySegment_.size() * sizeof(capnp::word);
    }
    /// Makes room for the next request.
    void drop();

private:
    bool isWhole() const {
        return isLong_ ? missing_.size() == 0 : messageBytes_ > 0;
    }
    /// Finds out what request is at the front, as soon as its table is there.
    void look();
    void moveToBuffer(Wire::SegmentTable const &table, std::size_t tableBytes);
    /// @return bytes that have come
    std::size_t receive();
    void removeFront(std::size_t bytes);

    /// Requests longer than this are few: those with lists.
    static constexpr std::size_t frontBytes = 512;

    ClientSocket &socket_;
    alignas(capnp::word) std::array<std::uint8_t, frontBytes> front_; ///< what has come and does not belong to buffer_
    std::size_t have_ = 0;                                            ///< bytes in front_
    std::size_t messageBytes_ = 0; ///< of the request in front_, once it is there whole; 0 before
    kj::ArrayPtr<capnp::word const> onlySegment_;
    bool isLong_ = false; ///< the request is in buffer_, and front_ holds what follows
    Wire::MessageBuffer buffer_;
    kj::ArrayPtr<kj::byte> missing_; ///< where the rest of a long request belongs
};

} // namespace Lumod
