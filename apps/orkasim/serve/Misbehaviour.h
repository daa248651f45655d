// SPDX-License-Identifier: Apache-2.0
//
// What a provider may do wrong, at will and repeatably: slowness, errors at a rate, and each thing that a client has to
// survive. Stands in front of the real service and lets through what it does not spoil.
#pragma once

#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include <kj/compat/http.h>
#include <kj/timer.h>

namespace Orkasim {

enum class Misdeed {
    Hang,        ///< never answers
    Drip,        ///< an answer at a byte a second
    Endless,     ///< an answer without an end
    Huge,        ///< announces 10 GB, and begins to send them
    Bomb,        ///< 64 MiB of blanks in a compressed body of 64 KiB
    Garbage,     ///< bytes that are no JSON
    Truncated,   ///< the first half of a document
    Redirect,    ///< to another place
    Reset,       ///< does what was asked, and breaks the connection instead of answering
    Unavailable, ///< status 503
};

struct MisbehaviourSpec {
    kj::Duration latency = 0 * kj::MILLISECONDS; ///< before every answer
    int64_t errorRate = 0;                       ///< percent of the requests that are answered with status 503
    uint64_t seed = 1;                           ///< of the choice which
    std::optional<Misdeed> misdeed;
    std::string operation;        ///< the misdeed hits this one only; empty: every one
    std::optional<int64_t> times; ///< this often; nothing: always
};

std::optional<Misdeed> misdeedNamed(std::string const &name);
std::vector<std::string> misdeedNames();

class Misbehaviour final : public kj::HttpService {
public:
    Misbehaviour(kj::HttpService &inner, kj::Timer &timer, MisbehaviourSpec spec);

    kj::Promise<void> request(kj::HttpMethod method, kj::StringPtr url, kj::HttpHeaders const &headers,
                              kj::AsyncInputStream &requestBody, Response &response) override;

private:
    bool isToBeHit(std::string const &operation);
    bool isToFail();
    kj::Promise<void> commit(Misdeed misdeed, kj::HttpMethod method, kj::StringPtr url, kj::HttpHeaders const &headers,
                             kj::AsyncInputStream &requestBody, Response &response);
    kj::Promise<void> sendForEver(kj::Own<kj::AsyncOutputStream> stream, std::string block, kj::Duration pause);

    kj::HttpService &inner_;
    kj::Timer &timer_;
    MisbehaviourSpec spec_;
    int64_t hits_ = 0;
    std::mt19937_64 random_;
    kj::Own<kj::HttpHeaderTable> table_;
};

} // namespace Orkasim
