// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace Bench {

/// The floor of every question to the daemon: a socket, one request that was serialized beforehand, and the bytes of
/// the replies read into one buffer that nobody looks into. Floors start from scratch in every round, so this knows
/// bytes only and stands on no library but the C one. Throws std::runtime_error for whatever goes wrong.
class RawSession {
public:
    explicit RawSession(std::string const &socketPath);
    ~RawSession();
    RawSession(RawSession const &) = delete;
    RawSession &operator=(RawSession const &) = delete;

    /// What ask() sends from now on, and how many messages answer it.
    void prepare(std::vector<std::byte> request, size_t replyCount);
    /// Sends the request and reads its replies. @return the bytes read.
    size_t ask();
    /// Whether something came, or the connection ended, since.
    bool isAnswered() const;
    size_t replyCount() const {
        return replyCount_;
    }
    std::vector<std::byte> const &request() const {
        return request_;
    }

protected:
    void send();
    /// Reads one message, segment table and all, to the beginning of buffer(). @return its bytes.
    size_t readMessage();
    std::vector<std::byte> const &buffer() const {
        return buffer_;
    }

private:
    int fd_;
    std::vector<std::byte> request_;
    std::vector<std::byte> buffer_;
    size_t replyCount_ = 0;
};

} // namespace Bench
