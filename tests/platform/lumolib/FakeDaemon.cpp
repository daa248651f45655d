// SPDX-License-Identifier: Apache-2.0
#include "FakeDaemon.h"

#include <stdexcept>

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <capnp/message.h>
#include <capnp/serialize.h>
#include <kj/string.h>

#include "wire/Failure.h"
#include "wire/SocketAddress.h"

namespace LumoTest {

namespace {

constexpr std::chrono::seconds patience{20};

Wire::Deadline soon() {
    return std::chrono::steady_clock::now() + patience;
}

std::string printed(Wire::Request::Reader request) {
    capnp::MallocMessageBuilder copy;
    copy.setRoot(request);
    Wire::Request::Builder root = copy.getRoot<Wire::Request>();
    root.setVersion(0);
    root.setId(0);
    root.setDeadlineMs(0);
    std::string const text = kj::str(root).cStr();
    std::string const prefix = "(version = 0, id = 0, deadlineMs = 0, ";
    return text.compare(0, prefix.size(), prefix) == 0 ? "(" + text.substr(prefix.size()) : text;
}

} // namespace

void Peer::reply(std::uint64_t id, std::function<void(Wire::Reply::Builder)> const &fill, bool last) {
    capnp::MallocMessageBuilder message;
    Wire::Reply::Builder reply = message.initRoot<Wire::Reply>();
    reply.setId(id);
    reply.setLast(last);
    fill(reply);
    Wire::send(socket_.get(), message, Wire::replyBytesMax, soon());
}

void Peer::done(std::uint64_t id) {
    reply(id, [](Wire::Reply::Builder reply) { reply.setDone(); });
}

void Peer::failure(std::uint64_t id, std::int32_t code, std::string const &sentence) {
    reply(id, [&](Wire::Reply::Builder reply) {
        Wire::FailureReply::Builder failure = reply.initFailure();
        failure.setCode(code);
        failure.setSentence(capnp::Text::Reader(sentence.c_str(), sentence.size()));
    });
}

void Peer::raw(void const *bytes, std::size_t size) {
    (void)!::send(socket_.get(), bytes, size, MSG_NOSIGNAL);
}

void Peer::rawReplies(std::vector<std::uint64_t> const &ids, std::size_t missingBytes) {
    std::string bytes;
    for (std::uint64_t const id : ids) {
        capnp::MallocMessageBuilder message;
        Wire::Reply::Builder reply = message.initRoot<Wire::Reply>();
        reply.setId(id);
        reply.setDone();
        kj::Array<capnp::word> const flat = capnp::messageToFlatArray(message);
        bytes.append(flat.asChars().begin(), flat.asChars().size());
    }
    raw(bytes.data(), bytes.size() - missingBytes);
}

void Peer::hangUp() {
    ::shutdown(socket_.get(), SHUT_RDWR);
}

bool Peer::clientLeaves(int milliseconds) {
    pollfd entry{socket_.get(), POLLRDHUP, 0};
    return ::poll(&entry, 1, milliseconds) > 0;
}

Listener::Listener(std::string const &socketPath, int backlog)
    : socket_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    ::unlink(socketPath.c_str());
    Wire::SocketAddress const address(socketPath);
    if (::bind(socket_.get(), address.get(), address.size()) != 0 || ::listen(socket_.get(), backlog) != 0) {
        throw std::runtime_error("no socket at " + socketPath);
    }
}

FakeDaemon::FakeDaemon(std::string const &socketPath, Handler handler, Greeting greeting)
    : socketPath_(socketPath)
    , handler_(std::move(handler))
    , greeting_(std::move(greeting))
    , listener_(socketPath, 16) {
    acceptor_ = std::thread([this] { accept(); });
}

FakeDaemon::~FakeDaemon() {
    ::unlink(socketPath_.c_str());
    ::shutdown(listener_.get(), SHUT_RDWR);
    acceptor_.join();
    {
        std::lock_guard const lock(mutex_);
        for (std::unique_ptr<Peer> const &peer : peers_) {
            peer->hangUp();
        }
    }
    for (std::thread &worker : workers_) {
        worker.join();
    }
}

std::vector<std::string> FakeDaemon::asked() const {
    std::lock_guard const lock(mutex_);
    return asked_;
}

int FakeDaemon::connections() const {
    std::lock_guard const lock(mutex_);
    return static_cast<int>(peers_.size());
}

void FakeDaemon::accept() {
    for (;;) {
        Wire::UniqueFd socket(::accept4(listener_.get(), nullptr, nullptr, SOCK_CLOEXEC));
        if (!socket) {
            return;
        }
        std::lock_guard const lock(mutex_);
        Peer &peer = *peers_.emplace_back(std::make_unique<Peer>(std::move(socket)));
        workers_.emplace_back([this, &peer] { serve(peer); });
    }
}

void FakeDaemon::serve(Peer &peer) {
    try {
        if (greeting_) {
            greeting_(peer);
        }
        Wire::MessageBuffer buffer;
        while (Wire::receive(peer.socket(), buffer, Wire::requestBytesMax, soon())) {
            capnp::SegmentArrayMessageReader reader(buffer.segments(), Wire::readerOptions(2 * buffer.bodyBytes()));
            Wire::Request::Reader const request = reader.getRoot<Wire::Request>();
            {
                std::lock_guard const lock(mutex_);
                asked_.push_back(printed(request));
            }
            handler_(request, peer);
        }
    } catch (Wire::Failure const &) {
        // The client left; whether it should have is for the test to say.
    }
    std::lock_guard const lock(mutex_);
    peer.close();
}

void answerDone(Wire::Request::Reader request, Peer &peer) {
    peer.done(request.getId());
}

} // namespace LumoTest
