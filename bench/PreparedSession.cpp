// SPDX-License-Identifier: Apache-2.0
#include "PreparedSession.h"

#include <capnp/serialize.h>
#include <stdexcept>

namespace Bench {

namespace {

std::vector<std::byte> serialize(PreparedSession::Fill const &fill) {
    capnp::MallocMessageBuilder message;
    auto request = message.initRoot<Wire::Request>();
    request.setVersion(Wire::PROTOCOL_VERSION);
    request.setId(1);
    request.setDeadlineMs(60000);
    fill(request);
    auto const words = capnp::messageToFlatArray(message);
    auto const bytes = words.asBytes();
    auto const *data = reinterpret_cast<std::byte const *>(bytes.begin());
    return {data, data + bytes.size()};
}

} // namespace

size_t PreparedSession::prepare(Fill const &fill, Look const &look) {
    begin(fill);
    size_t total = 0;
    size_t replyCount = 0;
    for (bool last = false; !last; ++replyCount) {
        size_t const size = readMessage();
        total += size;
        auto const flat =
            kj::arrayPtr(reinterpret_cast<capnp::word const *>(buffer().data()), size / sizeof(capnp::word));
        capnp::ReaderOptions options;
        options.traversalLimitInWords = UINT64_MAX;
        capnp::FlatArrayMessageReader reader(flat, options);
        auto const reply = reader.getRoot<Wire::Reply>();
        if (reply.isFailure()) {
            throw std::runtime_error(std::string("the daemon refused: ") + reply.getFailure().getSentence().cStr());
        }
        if (look) {
            look(reply);
        }
        last = reply.getLast();
    }
    RawSession::prepare(request(), replyCount);
    return total;
}

void PreparedSession::begin(Fill const &fill) {
    RawSession::prepare(serialize(fill), 0);
    send();
}

} // namespace Bench
