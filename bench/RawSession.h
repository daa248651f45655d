// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <capnp/message.h>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "wire/lumod.capnp.h"

namespace Bench {

/// The floor of every question to the daemon: a socket, one request that was serialized beforehand, and the bytes of
/// the replies read into one buffer that nobody looks into. Throws std::runtime_error for whatever goes wrong.
class RawSession {
public:
    explicit RawSession(std::string const &socketPath);
    ~RawSession();
    RawSession(RawSession const &) = delete;
    RawSession &operator=(RawSession const &) = delete;

    using Fill = std::function<void(Wire::Request::Builder)>;
    using Look = std::function<void(Wire::Reply::Reader)>;

    /// What ask() sends from now on. Asks once, reading the replies with care, to learn how many there are.
    /// @return the bytes read
    size_t prepare(Fill const &fill, Look const &look = {});
    /// The same with a request that was serialized before, and the number of its replies.
    void prepare(std::vector<std::byte> request, size_t replyCount);
    /// Sends the request and reads as many reply messages as the first time. @return the bytes read.
    size_t ask();
    /// Sends another request and waits for nothing.
    void begin(Fill const &fill);
    /// Whether something came, or the connection ended, since.
    bool isAnswered() const;
    size_t replyCount() const {
        return replyCount_;
    }
    std::vector<std::byte> const &request() const {
        return request_;
    }

private:
    void send();
    size_t readMessage();

    int fd_;
    std::vector<std::byte> request_;
    std::vector<std::byte> buffer_;
    size_t replyCount_ = 0;
};

} // namespace Bench
