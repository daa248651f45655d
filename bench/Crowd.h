// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "Channel.h"

namespace Bench {

/// Many clients of one server on one thread: each sends a request, waits for all of its answer, and sends the next.
class Crowd {
public:
    /// @param answerBytes how much answers the request; the same each time
    Crowd(Address const &server, TlsSettingsPtr const &tls, size_t clients, std::vector<std::byte> request,
          size_t answerBytes);
    ~Crowd();
    Crowd(Crowd const &) = delete;
    Crowd &operator=(Crowd const &) = delete;

    struct Round {
        int64_t nanoseconds;            ///< from the first request to the last answer
        std::vector<int64_t> latencies; ///< of each request, sorted
        int64_t percentile(double hundredths) const;
    };
    /// @throws std::runtime_error when the server goes away or answers too much
    Round run(size_t requests);

private:
    using Clock = std::chrono::steady_clock;
    struct Client {
        std::unique_ptr<Channel> channel;
        Clock::time_point asked;
        size_t missing = 0; ///< bytes of the answer that have not come
    };

    void ask(Client &client);
    /// @return whether the client has all of its answer
    bool read(Client &client);

    std::vector<Client> clients_;
    std::vector<std::byte> request_;
    std::vector<std::byte> buffer_;
    size_t answerBytes_;
    int epoll_;
};

} // namespace Bench
