// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

#include "wire/Stream.h"
#include "wire/compact/Builder.h"
#include "wire/compact/ReceivedMessage.h"

namespace Wire::Compact {

/// Sends one message; as sendSegments.
void send(int socket, MessageBuilder const &message, std::size_t bodyLimit, Deadline deadline,
          std::size_t *sentBytes = nullptr);

/// Receives one message; nothing is allocated for a table that does not pass.
/// @return false when the peer closed the connection between two messages
/// @throw Failure as receiveTable and receiveBody
bool receive(int socket, ReceivedMessage &message, std::size_t bodyLimit, Deadline deadline);

} // namespace Wire::Compact
