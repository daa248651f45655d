// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <sys/types.h>

#include "Channel.h"

namespace Bench {

/// The floor of every server: a process of its own with one thread and epoll that reads as many bytes as a request has
/// and sends as many as its answer has, and knows nothing of either. Ends with this object.
class EchoServer {
public:
    /// @param at a path that does not exist yet, or HOST:0
    EchoServer(Address const &at, TlsSettingsPtr const &tls, size_t requestBytes, size_t answerBytes);
    ~EchoServer();
    EchoServer(EchoServer const &) = delete;
    EchoServer &operator=(EchoServer const &) = delete;

    /// Where it listens, with the port that it was given.
    Address const &address() const {
        return address_;
    }

private:
    Address address_;
    pid_t process_;
};

} // namespace Bench
