// SPDX-License-Identifier: Apache-2.0
//
// Whole messages over a connected stream socket, for a program that waits for its answer: the client library, tests
// and measuring programs. (The daemon reads on its event loop and shares SegmentTable and MessageBuffer with this.)
//
// Every call ends by its deadline, however slowly the peer drips. A peer that goes away is a Failure, never a signal.
// Descriptors that a peer attaches are closed by the kernel, because nobody offers room for them. The descriptor may
// be blocking or not. Sentences do not name the peer; the caller knows who that is and says so.
#pragma once

#include <chrono>
#include <cstddef>

#include <capnp/message.h>

#include "wire/Limits.h"
#include "wire/MessageBuffer.h"

namespace Wire {

/// A moment of the monotonic clock, which no change of the date moves.
using Deadline = std::chrono::steady_clock::time_point;

/// Sends one message.
/// @param bodyLimit requestBytesMax or replyBytesMax
/// @param sentBytes if given, counts what the kernel took; 0 after a failure means that the peer saw nothing
/// @throw Failure MessageTooLarge before anything is sent; ConnectionLost, DeadlineExceeded, IoError
void send(int socket, capnp::MessageBuilder &message, std::size_t bodyLimit, Deadline deadline,
          std::size_t *sentBytes = nullptr);

/// Receives one message into the buffer.
/// @return false when the peer closed the connection between two messages
/// @throw Failure ProtocolError or MessageTooLarge, with nothing allocated, for a bad segment table; ConnectionLost in
///        mid-message; DeadlineExceeded; IoError. The connection is of no further use then.
bool receive(int socket, MessageBuffer &buffer, std::size_t bodyLimit, Deadline deadline);

} // namespace Wire
