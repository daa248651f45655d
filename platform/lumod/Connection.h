// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include <capnp/serialize.h>
#include <kj/async-io.h>

#include "Core.h"
#include "Dispatch.h"
#include "MessageReader.h"
#include "Shutdown.h"

namespace Lumod {

/// One client. Its requests are answered one after the other, in order; while one is worked on, the next is not read,
/// and of a long answer the next message is not made before the peer has taken the last. So a client costs one request
/// and one reply message of memory, whatever it does.
class Connection {
public:
    /// @param ordered whether changes of volumes wait for their turn
    /// @param number  names the connection in the log
    Connection(Core &core, Shutdown &shutdown, kj::Own<kj::AsyncIoStream> stream, bool ordered, uint64_t number);

    /// Serves until the peer goes, breaks the protocol, or the daemon shuts down.
    kj::Promise<void> run();

private:
    kj::Promise<void> answer();
    /// @throws Wire::Failure InvalidRequest; `id` is filled in as soon as it is known
    Wire::Request::Reader parse(uint64_t &id);
    Answer<ReplyPtr> handle(Wire::Request::Reader request, CallPtr const &call, kj::TimePoint end);
    kj::Promise<void> sendAll(uint64_t id, ReplyPtr source);
    kj::Promise<void> sendFailure(uint64_t id, Wire::Failure const &failure);
    kj::Promise<void> write(kj::Own<capnp::MallocMessageBuilder> message);
    void logFailure(CallPtr const &call, Wire::Request::Reader request, Wire::Failure const &failure);

    Core &core_;
    Shutdown &shutdown_;
    kj::Own<kj::AsyncIoStream> stream_;
    bool ordered_;
    uint64_t number_;
    MessageReader reader_;
    kj::Maybe<kj::Own<capnp::SegmentArrayMessageReader>> message_;
};

} // namespace Lumod
