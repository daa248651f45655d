// SPDX-License-Identifier: Apache-2.0
//
// How much one peer may ask of the other. Both ends check what they receive and what they send; a peer that breaks a
// limit is disconnected, and nothing is allocated on its word.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>

namespace Wire {

/// Bytes of a request message's body (its segments, without the segment table).
inline constexpr std::size_t requestBytesMax = std::size_t{1} << 20;
/// Bytes of a reply message's body.
inline constexpr std::size_t replyBytesMax = std::size_t{16} << 20;
/// Bytes of all reply messages that answer one request; a client gives up on a daemon that sends more.
inline constexpr std::uint64_t answerBytesMax = std::uint64_t{256} << 20;
/// Segments of one message. A builder that grows its segments stays far below.
inline constexpr std::uint32_t segmentCountMax = 64;
/// Structures within structures.
inline constexpr int nestingMax = 64;
/// A reader may visit each word of a message this often, so that many pointers to one place do not multiply it.
inline constexpr unsigned visitsOfAWordMax = 4;

/// What one reply of a long answer holds at most: elements, and about this many bytes.
inline constexpr std::size_t chunkElements = 1000;
inline constexpr std::size_t chunkBytes = std::size_t{1} << 20;
/// Ids in one checkLumoAccessibility request.
inline constexpr std::size_t lumoIdsPerRequest = 10000;

/// How long a client waits for a whole request unless TOVI_TIMEOUT_MS says otherwise.
inline constexpr std::chrono::milliseconds defaultDeadline{30000};

} // namespace Wire
