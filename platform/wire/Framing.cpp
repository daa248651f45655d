// SPDX-License-Identifier: Apache-2.0
#include "wire/Framing.h"

#include <algorithm>
#include <array>
#include <optional>
#include <span>

namespace Wire {

void send(int socket, capnp::MessageBuilder &message, std::size_t bodyLimit, Deadline deadline,
          std::size_t *sentBytes) {
    kj::ArrayPtr<kj::ArrayPtr<capnp::word const> const> const segments = message.getSegmentsForOutput();
    // One more than the limit is enough for the refusal.
    std::array<std::span<std::uint64_t const>, segmentCountMax + 1> spans;
    std::size_t const count = std::min(segments.size(), spans.size());
    for (std::size_t segment = 0; segment < count; ++segment) {
        spans[segment] = {reinterpret_cast<std::uint64_t const *>(segments[segment].begin()), segments[segment].size()};
    }
    sendSegments(socket, std::span(spans).first(count), bodyLimit, deadline, sentBytes);
}

bool receive(int socket, MessageBuffer &buffer, std::size_t bodyLimit, Deadline deadline) {
    std::optional<SegmentTable> const table = receiveTable(socket, bodyLimit, deadline);
    if (!table) {
        return false;
    }
    kj::ArrayPtr<kj::byte> body = buffer.prepare(*table);
    receiveBody(socket, std::span(body.begin(), body.size()), deadline);
    return true;
}

} // namespace Wire
