// SPDX-License-Identifier: Apache-2.0
//
// What a client costs that asked once and stays connected: memory of the daemon.
//
//   bench_idle COUNT...      on the daemon of TOVI_ROOT; counts grow
//
// One line a count: the count, and by how many bytes the daemon's resident memory of its own has grown since nobody was
// there.
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <string>
#include <sys/resource.h>
#include <vector>

#include "PreparedSession.h"

namespace {

/// Connects and asks once. @return the daemon's process
std::unique_ptr<Bench::PreparedSession> visitor(std::string const &socket, unsigned &daemon) {
    auto session = std::make_unique<Bench::PreparedSession>(socket);
    session->prepare([](Wire::Request::Builder request) { request.setPing(); },
                     [&daemon](Wire::Reply::Reader reply) { daemon = reply.getPong().getPid(); });
    return session;
}

long long residentBytes(unsigned process) {
    std::ifstream status("/proc/" + std::to_string(process) + "/status");
    for (std::string line; std::getline(status, line);) {
        if (line.compare(0, 8, "RssAnon:") == 0) {
            return std::strtoll(line.c_str() + 8, nullptr, 10) * 1024;
        }
    }
    throw std::runtime_error("the daemon's memory cannot be read");
}

void run(std::string const &socket, std::vector<size_t> const &counts) {
    rlimit limit{};
    getrlimit(RLIMIT_NOFILE, &limit);
    limit.rlim_cur = limit.rlim_max;
    setrlimit(RLIMIT_NOFILE, &limit);

    unsigned daemon = 0;
    // Those that come first bring in code and what is kept for good.
    for (int i = 0; i < 10; ++i) {
        visitor(socket, daemon);
    }
    long long const before = residentBytes(daemon);
    std::vector<std::unique_ptr<Bench::PreparedSession>> idle;
    for (size_t const count : counts) {
        while (idle.size() < count) {
            idle.push_back(visitor(socket, daemon));
        }
        std::printf("%zu %lld\n", count, residentBytes(daemon) - before);
    }
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    std::vector<size_t> counts;
    for (int i = 1; i < argc; ++i) {
        counts.push_back(std::strtoul(argv[i], nullptr, 10));
    }
    if (root == nullptr || counts.empty() || counts.front() == 0) {
        std::fputs("usage: TOVI_ROOT=DIR bench_idle COUNT...\n", stderr);
        return 2;
    }
    try {
        run(std::string(root) + "/run/lumod.sock", counts);
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_idle: %s\n", error.what());
        return 1;
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
