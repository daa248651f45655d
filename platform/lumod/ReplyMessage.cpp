// SPDX-License-Identifier: Apache-2.0
#include "ReplyMessage.h"

#include <capnp/serialize.h>

namespace Lumod {

namespace {

void putLittleEndian(kj::byte *place, uint32_t number) {
    for (unsigned byte = 0; byte < sizeof number; ++byte) {
        place[byte] = static_cast<kj::byte>(number >> (8 * byte));
    }
}

} // namespace

ReplyMessage::ReplyMessage(ReplyRoom &room, uint64_t id)
    : room_(room.words())
    , builder_(room_.slice(1, room_.size()))
    , reply_(builder_.initRoot<Wire::Reply>()) {
    reply_.setId(id);
}

kj::ArrayPtr<kj::byte const> ReplyMessage::framed() {
    auto const segments = builder_.getSegmentsForOutput();
    if (segments.size() > 1) {
        flat_ = capnp::messageToFlatArray(segments);
        return flat_.asBytes();
    }
    auto *const table = reinterpret_cast<kj::byte *>(room_.begin());
    putLittleEndian(table, 0); // one less than the number of segments
    putLittleEndian(table + sizeof(uint32_t), static_cast<uint32_t>(segments[0].size()));
    return room_.slice(0, 1 + segments[0].size()).asBytes();
}

} // namespace Lumod
