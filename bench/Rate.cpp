// SPDX-License-Identifier: Apache-2.0
//
// How many requests a server answers, against a server that answers as many bytes with as many bytes and does nothing
// else: in turns, by the same clients.
//
//   bench_rate daemon ping|containers CLIENTS ROUNDS REQUESTS             the daemon of TOVI_ROOT
//   bench_rate https ADDRESS:PORT TARGET CERT KEY CLIENTS ROUNDS REQUESTS a server of HTTP over TLS: POST TARGET with
//   {}
//
// One line a round: nanoseconds that REQUESTS requests took, for the server and for the other; then nanoseconds that
// half and 99 of 100 requests took at most: the server's two figures, the other's two.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <functional>
#include <poll.h>
#include <stdexcept>
#include <string>
#include <string_view>
#include <strings.h>
#include <sys/resource.h>
#include <unistd.h>
#include <vector>

#include "Crowd.h"
#include "EchoServer.h"
#include "PreparedSession.h"

namespace {

using Bench::Address;
using Bytes = std::vector<std::byte>;

struct Work {
    Address server;
    Address echo; ///< where the other server is to listen
    Bytes request;
    size_t answerBytes = 0;
    Bench::TlsSettingsPtr clientTls; ///< empty: none
    Bench::TlsSettingsPtr serverTls;
};

struct Amount {
    size_t clients;
    size_t rounds;
    size_t requests;

    explicit Amount(char **words)
        : clients(std::strtoul(words[0], nullptr, 10))
        , rounds(std::strtoul(words[1], nullptr, 10))
        , requests(std::strtoul(words[2], nullptr, 10)) {
        if (clients == 0 || rounds == 0 || requests == 0) {
            throw std::runtime_error("clients, rounds and requests are numbers above 0");
        }
    }
};

Work daemonWork(std::string const &what) {
    char const *const root = std::getenv("TOVI_ROOT");
    std::string const run = std::string(root == nullptr ? "" : root) + "/run/";
    Bench::PreparedSession session(run + "lumod.sock");
    Work work;
    if (what == "ping") {
        work.answerBytes = session.prepare([](Wire::Request::Builder request) { request.setPing(); });
    } else if (what == "containers") {
        work.answerBytes = session.prepare([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
    } else {
        throw std::runtime_error("the daemon is asked for ping or containers");
    }
    work.server.text = run + "lumod.sock";
    work.echo.text = run + "bench-echo-" + std::to_string(getpid()) + ".sock";
    work.request = session.request();
    return work;
}

/// Asks once and reads the answer with care. @return its bytes
size_t answerOf(Work const &work) {
    Bench::Channel channel(work.server.connect(), work.clientTls);
    channel.send(work.request);
    std::string answer;
    for (Bytes buffer(65536);;) {
        size_t const got = channel.receive(buffer);
        answer.append(reinterpret_cast<char const *>(buffer.data()), got);
        auto const headEnd = answer.find("\r\n\r\n");
        if (headEnd != std::string::npos) {
            if (answer.compare(0, 13, "HTTP/1.1 200 ") != 0) {
                throw std::runtime_error("the server refused: " + answer);
            }
            char const *const length = strcasestr(answer.c_str(), "\r\nContent-Length:");
            if (length == nullptr) {
                throw std::runtime_error("an answer without a length");
            }
            size_t const whole = headEnd + 4 + std::strtoul(std::strchr(length, ':') + 1, nullptr, 10);
            if (answer.size() >= whole) {
                return whole;
            }
        }
        if (channel.isOver()) {
            throw std::runtime_error("the server ended the connection");
        }
        pollfd waited{channel.fd(), POLLIN, 0};
        poll(&waited, 1, 10000);
    }
}

Work httpsWork(std::string const &server, std::string const &target, std::string const &certificate,
               std::string const &key) {
    Work work;
    work.server.text = server;
    work.echo.text = "127.0.0.1:0";
    work.clientTls = Bench::TlsSettings::client();
    work.serverTls = Bench::TlsSettings::server(certificate, key);
    std::string const text = "POST " + target + " HTTP/1.1\r\nHost: " + server +
                             "\r\nContent-Type: application/json\r\nContent-Length: 2\r\n\r\n{}";
    auto const *data = reinterpret_cast<std::byte const *>(text.data());
    work.request.assign(data, data + text.size());
    work.answerBytes = answerOf(work);
    return work;
}

void raiseDescriptorLimit() {
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) == 0) {
        limit.rlim_cur = limit.rlim_max;
        setrlimit(RLIMIT_NOFILE, &limit);
    }
}

void measure(Work const &work, Amount const &amount) {
    Bench::EchoServer const echo(work.echo, work.serverTls, work.request.size(), work.answerBytes);
    Bench::Crowd ours(work.server, work.clientTls, amount.clients, work.request, work.answerBytes);
    Bench::Crowd floor(echo.address(), work.clientTls, amount.clients, work.request, work.answerBytes);
    size_t const warmUp = std::max(amount.clients, amount.requests / 10);
    ours.run(warmUp);
    floor.run(warmUp);
    for (size_t round = 0; round < amount.rounds; ++round) {
        auto const a = ours.run(amount.requests);
        auto const b = floor.run(amount.requests);
        std::printf("%lld %lld %lld %lld %lld %lld\n", static_cast<long long>(a.nanoseconds),
                    static_cast<long long>(b.nanoseconds), static_cast<long long>(a.percentile(50)),
                    static_cast<long long>(a.percentile(99)), static_cast<long long>(b.percentile(50)),
                    static_cast<long long>(b.percentile(99)));
    }
}

int usage() {
    std::fputs("usage: TOVI_ROOT=DIR bench_rate daemon ping|containers CLIENTS ROUNDS REQUESTS\n"
               "       bench_rate https ADDRESS:PORT TARGET CERT KEY CLIENTS ROUNDS REQUESTS\n",
               stderr);
    return 2;
}

} // namespace

int main(int argc, char **argv) {
    std::string const mode = argc > 1 ? argv[1] : "";
    bool const isDaemon = mode == "daemon" && argc == 6;
    if (!isDaemon && !(mode == "https" && argc == 9)) {
        return usage();
    }
    try {
        raiseDescriptorLimit();
        measure(isDaemon ? daemonWork(argv[2]) : httpsWork(argv[2], argv[3], argv[4], argv[5]),
                Amount(argv + (isDaemon ? 3 : 6)));
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_rate: %s\n", error.what());
        return 1;
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
