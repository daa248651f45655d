// SPDX-License-Identifier: Apache-2.0
#include "RawSession.h"

#include <cerrno>
#include <cstring>
#include <poll.h>
#include <stdexcept>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>
#include <utility>

namespace Bench {

namespace {

[[noreturn]] void fail(std::string const &what) {
    throw std::runtime_error(what + ": " + std::strerror(errno));
}

void receive(int fd, void *into, size_t size) {
    ssize_t const got = recv(fd, into, size, MSG_WAITALL);
    if (got != static_cast<ssize_t>(size)) {
        fail("the daemon's reply ended early");
    }
}

} // namespace

RawSession::RawSession(std::string const &socketPath)
    : fd_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (fd_ < 0 || socketPath.size() >= sizeof(address.sun_path)) {
        fail("no socket for " + socketPath);
    }
    std::memcpy(address.sun_path, socketPath.c_str(), socketPath.size() + 1);
    if (connect(fd_, reinterpret_cast<sockaddr const *>(&address), sizeof(address)) != 0) {
        int const cause = errno;
        close(fd_);
        errno = cause;
        fail("cannot connect to " + socketPath);
    }
}

RawSession::~RawSession() {
    close(fd_);
}

void RawSession::prepare(std::vector<std::byte> request, size_t replyCount) {
    request_ = std::move(request);
    replyCount_ = replyCount;
}

size_t RawSession::ask() {
    send();
    size_t total = 0;
    for (size_t i = 0; i < replyCount_; ++i) {
        total += readMessage();
    }
    return total;
}

bool RawSession::isAnswered() const {
    pollfd waited{fd_, POLLIN, 0};
    return poll(&waited, 1, 0) > 0;
}

void RawSession::send() {
    if (::send(fd_, request_.data(), request_.size(), MSG_NOSIGNAL) != static_cast<ssize_t>(request_.size())) {
        fail("the request could not be sent");
    }
}

size_t RawSession::readMessage() {
    uint32_t head[2];
    receive(fd_, head, sizeof(head));
    size_t const segments = head[0] + size_t{1};
    // The table is padded to whole words: count and sizes together are an even number of 32-bit values.
    size_t const tableValues = (segments + 2) / 2 * 2;
    if (segments > 512) {
        throw std::runtime_error("a reply with too many segments");
    }
    uint32_t table[514];
    table[0] = head[0];
    table[1] = head[1];
    receive(fd_, table + 2, (tableValues - 2) * sizeof(uint32_t));
    size_t bodyWords = 0;
    for (size_t i = 1; i <= segments; ++i) {
        bodyWords += table[i];
    }
    size_t const tableBytes = tableValues * sizeof(uint32_t);
    size_t const size = tableBytes + bodyWords * sizeof(uint64_t);
    if (buffer_.size() < size) {
        buffer_.resize(size);
    }
    std::memcpy(buffer_.data(), table, tableBytes);
    receive(fd_, buffer_.data() + tableBytes, size - tableBytes);
    return size;
}

} // namespace Bench
