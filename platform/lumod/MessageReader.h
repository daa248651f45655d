// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include <kj/async-io.h>
#include <kj/timer.h>

#include "Async.h"
#include "wire/MessageBuffer.h"
#include "wire/SegmentTable.h"

namespace Lumod {

/// Reads requests from a connection, one at a time. A peer may be silent between two requests for as long as it likes,
/// but a request that has begun must be there within patience. Nothing is allocated for a message before its table has
/// passed the check.
class MessageReader {
public:
    static constexpr kj::Duration patience = 10 * kj::SECONDS;

    MessageReader(kj::AsyncInputStream &stream, kj::Timer &timer)
        : stream_(stream)
        , timer_(timer) {}

    /// Reads the next request into the buffer.
    /// @return false when the peer closed the connection. Failures: ProtocolError, MessageTooLarge, ConnectionLost,
    ///         DeadlineExceeded; the connection is of no further use then.
    Answer<bool> next();

    Wire::MessageBuffer &buffer() {
        return buffer_;
    }

private:
    Answer<bool> readMessage(std::size_t have);
    Answer<Done> readExactly(std::uint8_t *place, std::size_t bytes);

    kj::AsyncInputStream &stream_;
    kj::Timer &timer_;
    std::array<std::uint8_t, Wire::SegmentTable::bytesMax> table_{};
    Wire::MessageBuffer buffer_;
};

} // namespace Lumod
