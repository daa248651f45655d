// SPDX-License-Identifier: Apache-2.0
#include "Connection.h"

#include <algorithm>
#include <cerrno>
#include <utility>

#include <sys/socket.h>
#include <sys/time.h>

#include <boost/system/error_code.hpp>

#include "wire/Limits.h"
#include "wire/SocketAddress.h"

namespace LumoClient {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

/// A buffer that grew for a long answer is given back after it.
constexpr std::size_t keptBufferBytes = std::size_t{64} << 10;

std::string messageOf(int error) {
    return boost::system::error_code(error, boost::system::system_category()).message();
}

std::chrono::milliseconds remainder(Wire::Deadline deadline) {
    auto const left = std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    return std::max(left, std::chrono::milliseconds(1));
}

/// connect() on a Unix socket waits for room in the daemon's queue no longer than the send timeout.
void limitConnecting(int socket, Wire::Deadline deadline) {
    auto const left = remainder(deadline).count();
    timeval const limit{static_cast<time_t>(left / 1000), static_cast<suseconds_t>(left % 1000 * 1000)};
    setsockopt(socket, SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
}

Failure connectFailure(int error, std::string const &path, std::chrono::milliseconds timeout) {
    switch (error) {
    case ENOENT:
    case ENOTDIR:
    case ECONNREFUSED:
        return Failure(ErrorCode::DaemonNotRunning, "no daemon answers at " + path + ": " + messageOf(error));
    case EACCES:
    case EPERM:
        return Failure(ErrorCode::NotPermitted,
                       "the daemon's socket " + path + " may not be used: " + messageOf(error));
    case EAGAIN:
        return Failure(ErrorCode::DeadlineExceeded, "the daemon at " + path + " accepted no connection within " +
                                                        std::to_string(timeout.count()) + " ms");
    default:
        return Failure(ErrorCode::IoError, "no connection to the daemon at " + path + ": " + messageOf(error));
    }
}

/// What the daemon answered instead of a result. Its sentence is for the user as it stands.
Failure answered(Compact::FailureReply::Reader failure) {
    std::string_view const told = failure.getSentence();
    std::string_view const sentence = told.substr(0, told.find('\0')); // all that callers in C would see
    char const *general = Wire::textOf(failure.getCode());
    if (!sentence.empty()) {
        return Failure(static_cast<ErrorCode>(failure.getCode()), std::string(sentence));
    }
    return Failure(static_cast<ErrorCode>(failure.getCode()), general != nullptr ? general : "unknown error");
}

} // namespace

Connection::Connection(std::string socketPath, Settings const &settings)
    : socketPath_(std::move(socketPath))
    , timeout_(settings.timeout)
    , requestId_(settings.requestId)
    , offline_(settings.offline) {}

bool Connection::serves(std::string const &socketPath, Settings const &settings) const {
    return socketPath_ == socketPath && timeout_ == settings.timeout && offline_ == settings.offline;
}

Wire::Deadline Connection::deadline() const {
    return std::chrono::steady_clock::now() + timeout_;
}

Failure Connection::unexpected(std::string const &what) const {
    return Failure(ErrorCode::ProtocolError, "the daemon at " + socketPath_ + " broke the protocol: " + what);
}

/// Framing does not know who its peer is; this says it, and what becomes of a change that nobody answered for.
Failure Connection::explained(Failure const &failure, bool changeIsSent) const {
    std::string const daemon = "the daemon at " + socketPath_;
    switch (failure.code()) {
    case ErrorCode::DeadlineExceeded:
        return Failure(failure.code(), daemon + " gave no answer within " + std::to_string(timeout_.count()) + " ms" +
                                           (changeIsSent ? "; the change may still be carried out" : ""));
    case ErrorCode::ConnectionLost:
        return Failure(failure.code(), daemon + " closed the connection before it answered" +
                                           (changeIsSent ? "; the change may have been carried out" : ""));
    default:
        return Failure(failure.code(), daemon + " broke the protocol: " + failure.sentence());
    }
}

void Connection::close() {
    socket_.reset();
}

/// Between two requests the daemon has nothing to say: an end of the stream, or anything else, makes it useless.
bool Connection::peerIsSilent() const {
    char byte = 0;
    return recv(socket_.get(), &byte, 1, MSG_PEEK | MSG_DONTWAIT) < 0 && (errno == EAGAIN || errno == EWOULDBLOCK);
}

void Connection::connect(Wire::Deadline deadline) {
    if (offline_) {
        throw Failure(ErrorCode::DaemonNotRunning, "no daemon answers at " + socketPath_);
    }
    if (socket_ && peerIsSilent()) {
        return;
    }
    close();
    Wire::UniqueFd socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!socket) {
        throw connectFailure(errno, socketPath_, timeout_);
    }
    std::optional<Wire::SocketAddress> address;
    try {
        address.emplace(socketPath_);
    } catch (Failure const &failure) {
        throw failure.code() == ErrorCode::FileMissing ? connectFailure(ENOENT, socketPath_, timeout_) : failure;
    }
    int error = 0;
    do {
        limitConnecting(socket.get(), deadline);
        error = ::connect(socket.get(), address->get(), address->size()) < 0 ? errno : 0;
    } while (error == EINTR);
    if (error != 0) {
        throw connectFailure(error, socketPath_, timeout_);
    }
    socket_ = std::move(socket);
}

void Connection::request(Repeat repeat, Wire::Deadline deadline, Fill fill, Take take) {
    traffic_ = Traffic();
    RequestTrace trace(socketPath_, requestId_, traffic_);
    try {
        Compact::MessageBuilder message;
        Compact::Request::Builder request = message.initRoot<Compact::Request>();
        request.setVersion(Compact::PROTOCOL_VERSION);
        request.setId(++lastId_);
        request.setDeadlineMs(static_cast<std::uint32_t>(remainder(deadline).count()));
        request.setTraceId(requestId_);
        fill(request);
        traffic_.method = static_cast<std::uint16_t>(request.which());
        answerComplete_ = true; // until a request is on its way
        Compact::Reply::Reader reply = ask(message, repeat, deadline);
        take(reply);
        while (!answerComplete_) {
            reply = nextReply(repeat, deadline);
            take(reply);
        }
    } catch (Compact::Malformed const &) {
        close();
        trace.failed(ErrorCode::ProtocolError);
        throw unexpected("its reply is malformed");
    } catch (Failure const &failure) {
        trace.failed(failure.code());
        if (!answerComplete_) {
            close();
        }
        throw;
    } catch (...) {
        if (!answerComplete_) {
            close(); // what is left of the answer would be taken for the next one
        }
        throw;
    }
    if (received_.capacityBytes() > keptBufferBytes) {
        received_.release();
    }
}

void Connection::change(Fill fill) {
    request(Repeat::OnlyIfUnsent, deadline(), fill, [this](Compact::Reply::Reader reply) {
        if (!reply.isDone()) {
            throw unexpected("it answered something else than that it is done");
        }
    });
}

void Connection::requireChunk(std::size_t elements) const {
    if (elements > Wire::chunkElements) {
        throw unexpected("it sent a list of " + std::to_string(elements) + " elements in one message");
    }
}

Compact::Reply::Reader Connection::ask(Compact::MessageBuilder const &message, Repeat repeat, Wire::Deadline deadline) {
    bool const wasConnected = static_cast<bool>(socket_);
    std::size_t sentBytes = 0;
    try {
        return askOnce(message, repeat, deadline, sentBytes);
    } catch (Failure const &failure) {
        bool const mayRepeat = repeat == Repeat::Always || sentBytes == 0;
        if (!wasConnected || failure.code() != ErrorCode::ConnectionLost || !mayRepeat) {
            throw;
        }
    }
    return askOnce(message, repeat, deadline, sentBytes);
}

Compact::Reply::Reader Connection::askOnce(Compact::MessageBuilder const &message, Repeat repeat,
                                           Wire::Deadline deadline, std::size_t &sentBytes) {
    connect(deadline);
    answerBytes_ = 0;
    answerComplete_ = false;
    try {
        Compact::send(socket_.get(), message, Wire::requestBytesMax, deadline, &sentBytes);
        traffic_.sentBytes = sentBytes;
    } catch (Failure const &failure) {
        if (failure.code() == ErrorCode::MessageTooLarge) {
            answerComplete_ = true;
            throw Failure(failure.code(), "the request is too large: " + failure.sentence());
        }
        std::optional<Failure> const reason = partingWords(deadline);
        throw reason ? *reason : explained(failure, false); // half a request is not carried out
    }
    return nextReply(repeat, deadline);
}

/// A daemon that closed the connection before it read anything may have said why.
std::optional<Failure> Connection::partingWords(Wire::Deadline deadline) {
    try {
        if (Compact::receive(socket_.get(), received_, Wire::replyBytesMax, deadline)) {
            Compact::Reply::Reader const reply = received_.getRoot<Compact::Reply>();
            if (reply.isFailure() && reply.getId() == 0 && reply.getFailure().getCode() != 0) {
                return answered(reply.getFailure());
            }
        }
    } catch (Failure const &) { // nothing was said, then
    } catch (Compact::Malformed const &) {
    }
    return std::nullopt;
}

Compact::Reply::Reader Connection::nextReply(Repeat repeat, Wire::Deadline deadline) {
    try {
        if (!Compact::receive(socket_.get(), received_, Wire::replyBytesMax, deadline)) {
            throw Failure(ErrorCode::ConnectionLost, "the peer closed the connection");
        }
    } catch (Failure const &failure) {
        throw explained(failure, repeat == Repeat::OnlyIfUnsent);
    }
    answerBytes_ += received_.bodyBytes();
    traffic_.receivedBytes = answerBytes_;
    ++traffic_.replies;
    if (answerBytes_ > Wire::answerBytesMax) {
        throw unexpected("its answer is larger than " + std::to_string(Wire::answerBytesMax) + " bytes");
    }
    Compact::Reply::Reader const reply = received_.getRoot<Compact::Reply>();
    bool const mine = reply.getId() == lastId_;
    if (reply.isFailure() && (mine || reply.getId() == 0)) {
        if (reply.getFailure().getCode() == 0) {
            throw unexpected("it answered a failure without a code");
        }
        answerComplete_ = mine && reply.getLast();
        throw answered(reply.getFailure());
    }
    if (!mine) {
        throw unexpected("it answered request " + std::to_string(reply.getId()) + " instead of " +
                         std::to_string(lastId_));
    }
    answerComplete_ = reply.getLast();
    return reply;
}

} // namespace LumoClient
