// SPDX-License-Identifier: Apache-2.0
#include "wire/Stream.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <string>

#include <poll.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/uio.h>

#include <boost/system/error_code.hpp>

#include "wire/Failure.h"

namespace Wire {

namespace {

std::string messageOf(int error) {
    return boost::system::error_code(error, boost::system::system_category()).message();
}

[[noreturn]] void throwSocketError(int error, char const *doing) {
    if (error == EPIPE || error == ECONNRESET) {
        throw Failure(ErrorCode::ConnectionLost, "the peer closed the connection");
    }
    throw Failure(ErrorCode::IoError, std::string(doing) + " failed: " + messageOf(error));
}

/// Milliseconds until the deadline, rounded up so that waiting them does not end too early.
int checkedRemainder(Deadline deadline) {
    auto const remainder = std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    if (remainder.count() <= 0) {
        throw Failure(ErrorCode::DeadlineExceeded, "the peer was too slow");
    }
    return static_cast<int>(std::min<std::int64_t>(remainder.count(), INT32_MAX));
}

/// Whoever waits tries again, so that a signal, which ends this early, does no harm; the deadline ends it for good.
void waitFor(int socket, short events, Deadline deadline) {
    pollfd entry{socket, events, 0};
    poll(&entry, 1, checkedRemainder(deadline));
}

/// From now on a receive call ends when the deadline does, as far as the descriptor blocks at all.
void limitReceiving(int socket, Deadline deadline) {
    int const left = checkedRemainder(deadline);
    timeval const limit{left / 1000, static_cast<suseconds_t>(left % 1000 * 1000)};
    setsockopt(socket, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
}

/// Takes what is there, and waits inside the kernel for the rest: a long answer comes in many pieces, and being woken
/// for each one would cost more than to take it.
/// @return false when the peer closed the connection before the first byte
bool receiveExactly(int socket, std::span<std::uint8_t> into, Deadline deadline) {
    std::size_t done = 0;
    int flags = MSG_DONTWAIT;
    while (done < into.size()) {
        ssize_t const got = recv(socket, into.data() + done, into.size() - done, flags);
        int const error = got < 0 ? errno : 0;
        if (got > 0) {
            done += static_cast<std::size_t>(got);
        } else if (got == 0 && done == 0) {
            return false;
        } else if (got == 0) {
            throw Failure(ErrorCode::ConnectionLost, "the peer closed the connection in the middle of a message");
        } else if (error != EINTR && error != EAGAIN) {
            throwSocketError(error, "receiving");
        }
        if (done < into.size()) {
            if (flags == MSG_WAITALL && error == EAGAIN) {
                waitFor(socket, POLLIN, deadline); // the descriptor does not block, or the time is over
            }
            limitReceiving(socket, deadline);
            flags = MSG_WAITALL;
        }
    }
    return true;
}

/// A segment table and its segments as the kernel wants to gather them.
class Gathering {
public:
    Gathering(std::span<std::span<std::uint64_t const> const> segments, std::size_t bodyLimit) {
        std::uint64_t body = 0;
        for (std::span<std::uint64_t const> const segment : segments) {
            body += segment.size_bytes();
        }
        if (segments.size() > segmentCountMax) {
            throw Failure(ErrorCode::MessageTooLarge, "a message of " + std::to_string(segments.size()) +
                                                          " segments has more than the allowed " +
                                                          std::to_string(segmentCountMax));
        }
        if (body > bodyLimit) {
            throw Failure(ErrorCode::MessageTooLarge, "a message of " + std::to_string(body) +
                                                          " bytes is larger than the allowed " +
                                                          std::to_string(bodyLimit));
        }
        std::size_t number = 0;
        put(number++, segments.size() - 1);
        for (std::span<std::uint64_t const> const segment : segments) {
            put(number++, segment.size());
        }
        append(table_.data(), (4 * number + 7) / 8 * 8);
        for (std::span<std::uint64_t const> const segment : segments) {
            append(segment.data(), segment.size_bytes());
        }
    }

    bool empty() const {
        return first_ == count_;
    }

    msghdr header() {
        msghdr result{};
        result.msg_iov = pieces_.data() + first_;
        result.msg_iovlen = count_ - first_;
        return result;
    }

    void drop(std::size_t bytes) {
        while (first_ < count_ && bytes >= pieces_[first_].iov_len) {
            bytes -= pieces_[first_++].iov_len;
        }
        if (first_ < count_) {
            pieces_[first_].iov_base = static_cast<char *>(pieces_[first_].iov_base) + bytes;
            pieces_[first_].iov_len -= bytes;
        }
    }

private:
    void put(std::size_t place, std::size_t number) {
        for (std::size_t byte = 0; byte < 4; ++byte) {
            table_[4 * place + byte] = static_cast<std::uint8_t>(number >> (8 * byte));
        }
    }

    void append(void const *data, std::size_t size) {
        // The kernel only reads from it; iovec has no const form.
        pieces_[count_++] = iovec{const_cast<void *>(data), size};
    }

    std::array<std::uint8_t, SegmentTable::bytesMax> table_{};
    std::array<iovec, segmentCountMax + 1> pieces_{};
    std::size_t first_ = 0;
    std::size_t count_ = 0;
};

} // namespace

void sendSegments(int socket, std::span<std::span<std::uint64_t const> const> segments, std::size_t bodyLimit,
                  Deadline deadline, std::size_t *sentBytes) {
    Gathering gathering(segments, bodyLimit);
    checkedRemainder(deadline);
    while (!gathering.empty()) {
        msghdr const header = gathering.header();
        ssize_t const taken = sendmsg(socket, &header, MSG_DONTWAIT | MSG_NOSIGNAL);
        if (taken >= 0) {
            gathering.drop(static_cast<std::size_t>(taken));
            if (sentBytes != nullptr) {
                *sentBytes += static_cast<std::size_t>(taken);
            }
        } else if (errno == EAGAIN) {
            waitFor(socket, POLLOUT, deadline);
        } else if (errno != EINTR) {
            throwSocketError(errno, "sending");
        }
    }
}

std::optional<SegmentTable> receiveTable(int socket, std::size_t bodyLimit, Deadline deadline) {
    checkedRemainder(deadline);
    std::array<std::uint8_t, SegmentTable::bytesMax> table;
    if (!receiveExactly(socket, std::span(table.data(), SegmentTable::prefixBytes), deadline)) {
        return std::nullopt;
    }
    std::size_t const tableBytes = SegmentTable::bytesOf(table.data());
    receiveBody(socket, std::span(table).subspan(SegmentTable::prefixBytes, tableBytes - SegmentTable::prefixBytes),
                deadline);
    return SegmentTable(table.data(), bodyLimit);
}

void receiveBody(int socket, std::span<std::uint8_t> body, Deadline deadline) {
    if (!receiveExactly(socket, body, deadline)) {
        throw Failure(ErrorCode::ConnectionLost, "the peer closed the connection in the middle of a message");
    }
}

} // namespace Wire
