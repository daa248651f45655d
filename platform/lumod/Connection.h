// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <capnp/serialize.h>
#include <kj/async-unix.h>
#include <kj/timer.h>

#include "ClientSocket.h"
#include "Core.h"
#include "Dispatch.h"
#include "MessageReader.h"
#include "ReplyMessage.h"
#include "Shutdown.h"

namespace Lumod {

/// One client. Its requests are answered one after the other, in order; while one is worked on, the next is not read,
/// and of a long answer the next message is not made before the peer has taken the last. So a client costs one request
/// and one reply message of memory, whatever it does. A peer may be silent between two requests for as long as it
/// likes, but a request that has begun must be there within patience.
class Connection {
public:
    /// @param room    where every connection of the thread builds its small replies
    /// @param socket  never waits
    /// @param ordered whether changes of volumes wait for their turn
    /// @param number  names the connection in the log
    Connection(Core &core, Shutdown &shutdown, ReplyRoom &room, kj::UnixEventPort &port, kj::AutoCloseFd socket,
               bool ordered, uint64_t number);

    /// Serves until the peer goes, breaks the protocol, or the daemon shuts down.
    kj::Promise<void> run();

private:
    /// What is still to be waited for; empty when all is done.
    using Rest = kj::Maybe<kj::Promise<void>>;

    kj::Promise<void> serve();
    kj::Promise<void> serveLater();
    kj::Promise<void> waitForMore();
    void logClosed(Wire::Failure const &failure);
    /// Answers the request that the reader holds.
    Rest answer();
    void dropRequest();
    /// @throws Wire::Failure InvalidRequest; `id` is filled in as soon as it is known
    Wire::Request::Reader parse(uint64_t &id);
    /// What is waited for ends, whatever happens.
    Answer<ReplyPtr> bounded(Answer<ReplyPtr> answer, Wire::Request::Reader request, kj::TimePoint end);
    Rest reply(uint64_t id, CallPtr const &call, Wire::Request::Reader request, Outcome<ReplyPtr> outcome);
    Rest sendAll(uint64_t id, ReplyPtr source);
    Rest sendFailure(uint64_t id, Wire::Failure const &failure);
    /// For a message that takes room of its own.
    kj::Promise<void> sendLong(uint64_t id, ReplyPtr source);
    kj::Promise<void> sendAllAfter(kj::Promise<void> taken, uint64_t id, ReplyPtr source);
    /// For a message in the shared room, which is free again when this returns.
    Rest send(ReplyMessage &message);
    kj::Promise<void> inTime(kj::Promise<void> taken);
    void logFailure(CallPtr const &call, Wire::Request::Reader request, Wire::Failure const &failure);

    Core &core_;
    Shutdown &shutdown_;
    ReplyRoom &room_;
    ClientSocket socket_;
    bool ordered_;
    uint64_t number_;
    MessageReader reader_;
    std::optional<kj::TimePoint> requestDue_; ///< of a request that has begun
    bool isAnswering_ = false;                ///< a request is under way that something has to be waited for
    std::optional<capnp::SegmentArrayMessageReader> message_;
};

} // namespace Lumod
