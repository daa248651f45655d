// SPDX-License-Identifier: Apache-2.0
//
// Whole messages as words over a connected stream socket, for a program that waits for its answer. What the words mean
// is the business of the two layers above: wire/compact/Framing.h for clients, wire/Framing.h for whoever links the
// Cap'n Proto library anyway. (The daemon reads on its event loop and shares SegmentTable with this.)
//
// Every call ends by its deadline, however slowly the peer drips. A peer that goes away is a Failure, never a signal.
// Descriptors that a peer attaches are closed by the kernel, because nobody offers room for them. The descriptor may
// be blocking or not. Sentences do not name the peer; the caller knows who that is and says so.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "wire/Limits.h"
#include "wire/SegmentTable.h"

namespace Wire {

/// A moment of the monotonic clock, which no change of the date moves.
using Deadline = std::chrono::steady_clock::time_point;

/// Sends one message: the table of its segments, and them.
/// @param bodyLimit requestBytesMax or replyBytesMax
/// @param sentBytes if given, counts what the kernel took; 0 after a failure means that the peer saw nothing
/// @throw Failure MessageTooLarge before anything is sent; ConnectionLost, DeadlineExceeded, IoError
void sendSegments(int socket, std::span<std::span<std::uint64_t const> const> segments, std::size_t bodyLimit,
                  Deadline deadline, std::size_t *sentBytes = nullptr);

/// Receives the table of the next message.
/// @return nullopt when the peer closed the connection between two messages
/// @throw Failure ProtocolError or MessageTooLarge for a bad table; ConnectionLost in its middle; DeadlineExceeded;
///        IoError. The connection is of no further use then.
std::optional<SegmentTable> receiveTable(int socket, std::size_t bodyLimit, Deadline deadline);

/// Receives the body that the table announced.
/// @throw Failure ConnectionLost, DeadlineExceeded, IoError; the connection is of no further use then
void receiveBody(int socket, std::span<std::uint8_t> body, Deadline deadline);

} // namespace Wire
