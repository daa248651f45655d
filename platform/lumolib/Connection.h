// SPDX-License-Identifier: Apache-2.0
//
// One of the daemon's two sockets: connecting, one request at a time with its whole answer, and what to do when the
// daemon goes away. Both faces of this library stand on it: Client.h, and through Session.h the C interface.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "FunctionRef.h"
#include "RequestTrace.h"
#include "lumolib/Client.h"
#include "wire/UniqueFd.h"
#include "wire/compact/Framing.h"
#include "wire/lumod.compact.h"

namespace LumoClient {

/// The messages, as a client reads and writes them.
namespace Compact = Wire::Compact;

/// What may be done about a connection that turns out to be lost: a request that only reads may always be asked again,
/// one that changes something only when the daemon cannot have seen any of it.
enum class Repeat { Always, OnlyIfUnsent };

class Connection {
public:
    using Fill = FunctionRef<void(Compact::Request::Builder)>;
    using Take = FunctionRef<void(Compact::Reply::Reader)>;

    Connection(std::string socketPath, Settings const &settings);

    /// Whether it would do for a session that is opened now: the same daemon, as long to wait, offline or not.
    bool serves(std::string const &socketPath, Settings const &settings) const;

    /// The moment at which a request that begins now has failed.
    Wire::Deadline deadline() const;

    /// Connects unless that is done and the daemon is still there.
    /// @throw Wire::Failure DaemonNotRunning and others
    void connect(Wire::Deadline deadline);

    /// Asks one request and hands each reply of its answer to take, all of them before the deadline. A reply is gone
    /// when take returns. Failures that the daemon answers, and replies that are no proper messages, are thrown.
    /// @param take checks that the reply is of the kind asked for; unexpected() is what it throws if not
    /// @throw Wire::Failure, std::bad_alloc
    void request(Repeat repeat, Wire::Deadline deadline, Fill fill, Take take);

    /// A request that changes something and is answered with done.
    void change(Fill fill);

    /// Checks a list of a reply: longer ones come in chunks, so a longer one is a lie about its size.
    /// @throw Wire::Failure ProtocolError
    void requireChunk(std::size_t elements) const;
    /// A failure for a reply that makes no sense: "the daemon at SOCKET broke the protocol: WHAT".
    Wire::Failure unexpected(std::string const &what) const;

private:
    Compact::Reply::Reader ask(Compact::MessageBuilder const &message, Repeat repeat, Wire::Deadline deadline);
    Compact::Reply::Reader askOnce(Compact::MessageBuilder const &message, Repeat repeat, Wire::Deadline deadline,
                                   std::size_t &sentBytes);
    Compact::Reply::Reader nextReply(Repeat repeat, Wire::Deadline deadline);
    std::optional<Wire::Failure> partingWords(Wire::Deadline deadline);
    bool peerIsSilent() const;
    void close();
    Wire::Failure explained(Wire::Failure const &failure, bool changeIsSent) const;

    std::string const socketPath_;
    std::chrono::milliseconds const timeout_;
    std::string const requestId_;
    bool const offline_;
    Wire::UniqueFd socket_;
    std::uint64_t lastId_ = 0;
    std::uint64_t answerBytes_ = 0;
    Traffic traffic_;
    bool answerComplete_ = true;
    Compact::ReceivedMessage received_;
};

} // namespace LumoClient
