// SPDX-License-Identifier: Apache-2.0
#include "Connection.h"

#include <algorithm>
#include <cerrno>
#include <new>
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

/// Nearly every request fits; a larger one grows on the heap.
constexpr std::size_t scratchWords = 128;
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
Failure answered(Wire::FailureReply::Reader failure) {
    capnp::Text::Reader const sentence = failure.getSentence();
    char const *general = Wire::textOf(failure.getCode());
    if (sentence.size() > 0) {
        return Failure(static_cast<ErrorCode>(failure.getCode()), std::string(sentence.cStr(), sentence.size()));
    }
    return Failure(static_cast<ErrorCode>(failure.getCode()), general != nullptr ? general : "unknown error");
}

} // namespace

Connection::Connection(std::string socketPath, Settings const &settings)
    : socketPath_(std::move(socketPath))
    , timeout_(settings.timeout)
    , requestId_(settings.requestId)
    , offline_(settings.offline) {}

Wire::Deadline Connection::deadline() const {
    return std::chrono::steady_clock::now() + timeout_;
}

Failure Connection::unexpected(std::string const &what) const {
    return Failure(ErrorCode::ProtocolError, "the daemon at " + socketPath_ + " broke the protocol: " + what);
}

/// Framing does not know who its peer is; this says it.
Failure Connection::explained(Failure const &failure) const {
    std::string const daemon = "the daemon at " + socketPath_;
    switch (failure.code()) {
    case ErrorCode::DeadlineExceeded:
        return Failure(failure.code(), daemon + " gave no answer within " + std::to_string(timeout_.count()) + " ms");
    case ErrorCode::ConnectionLost:
        return Failure(failure.code(), daemon + " closed the connection before it answered");
    default:
        return Failure(failure.code(), daemon + " broke the protocol: " + failure.sentence());
    }
}

void Connection::close() {
    reader_.reset();
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
    capnp::word scratch[scratchWords] = {};
    reader_.reset();
    traffic_ = Traffic();
    RequestTrace trace(socketPath_, requestId_, traffic_);
    try {
        capnp::MallocMessageBuilder message(kj::arrayPtr(scratch, scratchWords));
        Wire::Request::Builder request = message.initRoot<Wire::Request>();
        request.setVersion(Wire::PROTOCOL_VERSION);
        request.setId(++lastId_);
        request.setDeadlineMs(static_cast<std::uint32_t>(remainder(deadline).count()));
        request.setTraceId(textOf(requestId_));
        fill(request);
        traffic_.method = static_cast<std::uint16_t>(request.which());
        answerComplete_ = true; // until a request is on its way
        Wire::Reply::Reader reply = ask(message, repeat, deadline);
        take(reply);
        while (!answerComplete_) {
            reply = nextReply(deadline);
            take(reply);
        }
    } catch (kj::Exception const &exception) {
        close();
        if (exception.getType() == kj::Exception::Type::OVERLOADED) {
            throw std::bad_alloc();
        }
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
    reader_.reset();
    if (buffer_.capacityBytes() > keptBufferBytes) {
        buffer_.release();
    }
}

void Connection::change(Fill fill) {
    request(Repeat::OnlyIfUnsent, deadline(), kj::mv(fill), [this](Wire::Reply::Reader reply) {
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

Wire::Reply::Reader Connection::ask(capnp::MessageBuilder &message, Repeat repeat, Wire::Deadline deadline) {
    bool const wasConnected = static_cast<bool>(socket_);
    std::size_t sentBytes = 0;
    try {
        return askOnce(message, deadline, sentBytes);
    } catch (Failure const &failure) {
        bool const mayRepeat = repeat == Repeat::Always || sentBytes == 0;
        if (!wasConnected || failure.code() != ErrorCode::ConnectionLost || !mayRepeat) {
            throw;
        }
    }
    return askOnce(message, deadline, sentBytes);
}

Wire::Reply::Reader Connection::askOnce(capnp::MessageBuilder &message, Wire::Deadline deadline,
                                        std::size_t &sentBytes) {
    connect(deadline);
    answerBytes_ = 0;
    answerComplete_ = false;
    try {
        Wire::send(socket_.get(), message, Wire::requestBytesMax, deadline, &sentBytes);
        traffic_.sentBytes = sentBytes;
    } catch (Failure const &failure) {
        if (failure.code() == ErrorCode::MessageTooLarge) {
            answerComplete_ = true;
            throw Failure(failure.code(), "the request is too large: " + failure.sentence());
        }
        std::optional<Failure> const reason = partingWords(deadline);
        throw reason ? *reason : explained(failure);
    }
    return nextReply(deadline);
}

/// A daemon that closed the connection before it read anything may have said why.
std::optional<Failure> Connection::partingWords(Wire::Deadline deadline) {
    try {
        if (Wire::receive(socket_.get(), buffer_, Wire::replyBytesMax, deadline)) {
            capnp::SegmentArrayMessageReader reader(buffer_.segments(), Wire::readerOptions(buffer_.bodyBytes()));
            Wire::Reply::Reader const reply = reader.getRoot<Wire::Reply>();
            if (reply.isFailure() && reply.getId() == 0) {
                return answered(reply.getFailure());
            }
        }
    } catch (Failure const &) { // nothing was said, then
    } catch (kj::Exception const &) {
    }
    return std::nullopt;
}

Wire::Reply::Reader Connection::nextReply(Wire::Deadline deadline) {
    reader_.reset();
    try {
        if (!Wire::receive(socket_.get(), buffer_, Wire::replyBytesMax, deadline)) {
            throw Failure(ErrorCode::ConnectionLost, "the peer closed the connection");
        }
    } catch (Failure const &failure) {
        throw explained(failure);
    }
    answerBytes_ += buffer_.bodyBytes();
    traffic_.receivedBytes = answerBytes_;
    ++traffic_.replies;
    if (answerBytes_ > Wire::answerBytesMax) {
        throw unexpected("its answer is larger than " + std::to_string(Wire::answerBytesMax) + " bytes");
    }
    reader_.emplace(buffer_.segments(), Wire::readerOptions(buffer_.bodyBytes()));
    Wire::Reply::Reader const reply = reader_->getRoot<Wire::Reply>();
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
