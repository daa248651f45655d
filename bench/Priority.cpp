// SPDX-License-Identifier: Apache-2.0
//
// How long a request over the priority socket takes while the ordered queue is stuck: its first change waits for a
// provider that does not answer, and a hundred more wait behind it.
//
//   bench_priority CONTAINER UUID ROUNDS REQUESTS   on the daemon of TOVI_ROOT, whose provider hangs in
//   createVirtualVolume
//
// A line a round for a ping, for the question for all containers, and for a change (binding a volume that is bound):
// "free" before the queue is stuck or "stuck", the name, nanoseconds that half and 99 of 100 requests took at most, and
// those of the longest.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "PreparedSession.h"

namespace {

constexpr size_t waitingChanges = 100;

using Bench::PreparedSession;

struct Amount {
    size_t rounds;
    size_t requests;
};

void printRound(char const *queue, char const *name, PreparedSession &session, PreparedSession::Fill const &fill,
                size_t requests) {
    session.prepare(fill);
    std::vector<long long> taken;
    for (size_t i = 0; i < requests; ++i) {
        auto const start = std::chrono::steady_clock::now();
        session.ask();
        taken.push_back((std::chrono::steady_clock::now() - start) / std::chrono::nanoseconds(1));
    }
    std::sort(taken.begin(), taken.end());
    std::printf("%s %s %lld %lld %lld\n", queue, name, taken[requests / 2], taken[requests * 99 / 100], taken.back());
}

void printRounds(char const *queue, std::string const &root, PreparedSession::Fill const &bind, Amount amount) {
    PreparedSession session(root + "/run/lumod-priority.sock");
    for (size_t round = 0; round < amount.rounds; ++round) {
        printRound(
            queue, "ping", session, [](auto request) { request.setPing(); }, amount.requests);
        printRound(
            queue, "containers", session, [](auto request) { request.setGetStorageContainer(); }, amount.requests);
        printRound(queue, "bind", session, bind, amount.requests);
    }
}

void run(std::string const &root, std::string const &container, std::string const &uuid, Amount amount) {
    auto const bind = [&](Wire::Request::Builder request) {
        auto key = request.initBindVirtualVolume();
        key.setContainerId(container);
        key.setUuid(uuid);
    };
    printRounds("free", root, bind, amount);

    std::vector<std::unique_ptr<PreparedSession>> stuck;
    for (size_t i = 0; i <= waitingChanges; ++i) {
        stuck.push_back(std::make_unique<PreparedSession>(root + "/run/lumod.sock"));
        if (i == 0) {
            stuck.back()->begin([&](Wire::Request::Builder request) {
                auto create = request.initCreateVirtualVolume();
                create.setContainerId(container);
                create.setDirectoryName("stuck");
            });
            // The daemon has read it before it answers a ping that came later.
            PreparedSession(root + "/run/lumod.sock").prepare([](Wire::Request::Builder request) {
                request.setPing();
            });
        } else {
            stuck.back()->begin(bind);
        }
    }

    printRounds("stuck", root, bind, amount);

    if (std::any_of(stuck.begin(), stuck.end(), [](auto const &session) { return session->isAnswered(); })) {
        throw std::runtime_error("the ordered queue is not stuck: a change in it was answered");
    }
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    bool const isWhole = root != nullptr && argc == 5;
    Amount const amount =
        isWhole ? Amount{std::strtoul(argv[3], nullptr, 10), std::strtoul(argv[4], nullptr, 10)} : Amount{};
    if (amount.rounds == 0 || amount.requests == 0) {
        std::fputs("usage: TOVI_ROOT=DIR bench_priority CONTAINER UUID ROUNDS REQUESTS\n", stderr);
        return 2;
    }
    try {
        run(root, argv[1], argv[2], amount);
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_priority: %s\n", error.what());
        return 1;
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
