// SPDX-License-Identifier: Apache-2.0
//
// wire/Stream.h for the messages of the Cap'n Proto library: for tests and measuring programs, which may link it.
// Clients use wire/compact/Framing.h.
#pragma once

#include <cstddef>

#include <capnp/message.h>

#include "wire/MessageBuffer.h"
#include "wire/Stream.h"

namespace Wire {

/// Sends one message; as sendSegments.
void send(int socket, capnp::MessageBuilder &message, std::size_t bodyLimit, Deadline deadline,
          std::size_t *sentBytes = nullptr);

/// Receives one message into the buffer; nothing is allocated for a table that does not pass.
/// @return false when the peer closed the connection between two messages
/// @throw Failure as receiveTable and receiveBody
bool receive(int socket, MessageBuffer &buffer, std::size_t bodyLimit, Deadline deadline);

} // namespace Wire
