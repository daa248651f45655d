// SPDX-License-Identifier: Apache-2.0
#include "ClientSocket.h"

#include <utility>

#include <sys/socket.h>

#include <kj/debug.h>

namespace Lumod {

using Observer = kj::UnixEventPort::FdObserver;

ClientSocket::ClientSocket(kj::UnixEventPort &port, kj::AutoCloseFd socket)
    : port_(port)
    , socket_(kj::mv(socket))
    , observer_(kj::heap<Observer>(port, socket_.get(), Observer::OBSERVE_READ)) {}

std::size_t ClientSocket::receive(std::uint8_t *place, std::size_t bytes) {
    ssize_t got = 0;
    KJ_NONBLOCKING_SYSCALL(got = ::recv(socket_.get(), place, bytes, MSG_DONTWAIT));
    isOver_ = got == 0;
    return got < 0 ? 0 : static_cast<std::size_t>(got);
}

kj::Promise<void> ClientSocket::readable() {
    return observer_->whenBecomesReadable();
}

std::size_t ClientSocket::send(kj::ArrayPtr<kj::byte const> bytes) {
    ssize_t sent = 0;
    KJ_NONBLOCKING_SYSCALL(sent = ::send(socket_.get(), bytes.begin(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL));
    return sent < 0 ? 0 : static_cast<std::size_t>(sent);
}

kj::Promise<void> ClientSocket::sendAll(kj::ArrayPtr<kj::byte const> bytes) {
    std::size_t const sent = send(bytes);
    if (sent == bytes.size()) {
        return kj::READY_NOW;
    }
    return writable().then([this, rest = bytes.slice(sent, bytes.size())] { return sendAll(rest); });
}

kj::Promise<void> ClientSocket::writable() {
    if (!std::exchange(observesWriting_, true)) {
        // Most clients are never waited for. Observed for writing from the start, each would wake the loop once more
        // whenever it takes an answer.
        observer_ = nullptr; // first: the port knows a descriptor once
        observer_ = kj::heap<Observer>(port_, socket_.get(), Observer::OBSERVE_READ_WRITE);
    }
    return observer_->whenBecomesWritable();
}

kj::Promise<void> ClientSocket::disconnected() {
    return observer_->whenWriteDisconnected();
}

} // namespace Lumod
