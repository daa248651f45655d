// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include <capnp/message.h>

#include "wire/lumod.capnp.h"

namespace Lumod {

/// Room for one reply message. All connections share one for what is small and sent at once, so that it is always the
/// same memory, near the processor and clean.
class ReplyRoom {
public:
    /// What a message takes besides its list, and what an estimate may be short by.
    static constexpr std::size_t leastWords = 1024;

    /// @param bytes about how many the message's list takes
    explicit ReplyRoom(std::size_t bytes = 0)
        : count_(leastWords + bytes / sizeof(capnp::word) * 9 / 8)
        , words_(new capnp::word[count_]()) {}

    kj::ArrayPtr<capnp::word> words() {
        return kj::arrayPtr(words_.get(), count_);
    }

private:
    std::size_t count_;
    std::unique_ptr<capnp::word[]> words_;
};

/// One message of an answer as it is built, and then as it travels. It is built in one segment, which is the quickest
/// to read, as long as the room suffices.
class ReplyMessage {
public:
    /// @param room free until the message ends
    ReplyMessage(ReplyRoom &room, uint64_t id);

    Wire::Reply::Builder reply() {
        return reply_;
    }
    /// The whole message in the wire's framing; valid as long as message and room are. Nothing is changed after it.
    kj::ArrayPtr<kj::byte const> framed();

private:
    kj::ArrayPtr<capnp::word> room_;
    capnp::MallocMessageBuilder builder_; ///< behind the room's first word, where the table goes
    Wire::Reply::Builder reply_;
    kj::Array<capnp::word> flat_; ///< of a message that did not fit
};

} // namespace Lumod
