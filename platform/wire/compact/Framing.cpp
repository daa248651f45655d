// SPDX-License-Identifier: Apache-2.0
#include "wire/compact/Framing.h"

namespace Wire::Compact {

void send(int socket, MessageBuilder const &message, std::size_t bodyLimit, Deadline deadline, std::size_t *sentBytes) {
    std::span<Word const> const segment = message.words();
    sendSegments(socket, {&segment, 1}, bodyLimit, deadline, sentBytes);
}

bool receive(int socket, ReceivedMessage &message, std::size_t bodyLimit, Deadline deadline) {
    std::optional<SegmentTable> const table = receiveTable(socket, bodyLimit, deadline);
    if (!table) {
        return false;
    }
    receiveBody(socket, message.prepare(*table), deadline);
    return true;
}

} // namespace Wire::Compact
