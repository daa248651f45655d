// SPDX-License-Identifier: Apache-2.0
#include "Crowd.h"

#include <algorithm>
#include <cerrno>
#include <stdexcept>
#include <sys/epoll.h>
#include <unistd.h>
#include <utility>

namespace Bench {

namespace {

constexpr size_t bufferBytes = size_t{64} << 10;
constexpr int patienceMs = 60000;

} // namespace

Crowd::Crowd(Address const &server, TlsSettingsPtr const &tls, size_t clients, std::vector<std::byte> request,
             size_t answerBytes)
    : request_(std::move(request))
    , buffer_(bufferBytes)
    , answerBytes_(answerBytes)
    , epoll_(epoll_create1(EPOLL_CLOEXEC)) {
    if (epoll_ < 0) {
        failWithErrno("epoll");
    }
    for (size_t i = 0; i < clients; ++i) {
        clients_.push_back({std::make_unique<Channel>(server.connect(), tls), {}, 0});
        epoll_event interest{};
        interest.events = EPOLLIN;
        interest.data.u64 = i;
        if (epoll_ctl(epoll_, EPOLL_CTL_ADD, clients_.back().channel->fd(), &interest) != 0) {
            failWithErrno("epoll");
        }
    }
}

Crowd::~Crowd() {
    close(epoll_);
}

int64_t Crowd::Round::percentile(double hundredths) const {
    auto const place = static_cast<size_t>(hundredths / 100 * static_cast<double>(latencies.size()));
    return latencies.at(std::min(place, latencies.size() - 1));
}

void Crowd::ask(Client &client) {
    client.asked = Clock::now();
    client.missing = answerBytes_;
    client.channel->send(request_);
}

bool Crowd::read(Client &client) {
    while (size_t const got = client.channel->receive(buffer_)) {
        if (got > client.missing) {
            throw std::runtime_error("the server answers more than it did before");
        }
        client.missing -= got;
    }
    if (client.channel->isOver()) {
        throw std::runtime_error("the server went away");
    }
    return client.missing == 0;
}

Crowd::Round Crowd::run(size_t requests) {
    Round round{0, {}};
    round.latencies.reserve(requests);
    auto const start = Clock::now();
    size_t begun = 0;
    for (; begun < std::min(requests, clients_.size()); ++begun) {
        ask(clients_[begun]);
    }
    std::vector<epoll_event> events(clients_.size());
    while (round.latencies.size() < requests) {
        int const ready = epoll_wait(epoll_, events.data(), static_cast<int>(events.size()), patienceMs);
        if (ready == 0 || (ready < 0 && errno != EINTR)) {
            throw std::runtime_error("no answer");
        }
        for (int i = 0; i < ready; ++i) {
            Client &client = clients_[events[static_cast<size_t>(i)].data.u64];
            // What comes between two requests is TLS's own.
            bool const waits = client.missing > 0;
            if (read(client) && waits) {
                round.latencies.push_back((Clock::now() - client.asked) / std::chrono::nanoseconds(1));
                if (begun < requests) {
                    ++begun;
                    ask(client);
                }
            }
        }
    }
    round.nanoseconds = (Clock::now() - start) / std::chrono::nanoseconds(1);
    std::sort(round.latencies.begin(), round.latencies.end());
    return round;
}

} // namespace Bench
