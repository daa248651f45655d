// SPDX-License-Identifier: Apache-2.0
#include "serve/Misbehaviour.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include <kj/compat/gzip.h>
#include <kj/debug.h>

namespace Orkasim {

namespace {

constexpr std::array<std::pair<char const *, Misdeed>, 10> misdeeds{{{"hang", Misdeed::Hang},
                                                                     {"drip", Misdeed::Drip},
                                                                     {"endless", Misdeed::Endless},
                                                                     {"huge", Misdeed::Huge},
                                                                     {"bomb", Misdeed::Bomb},
                                                                     {"garbage", Misdeed::Garbage},
                                                                     {"truncated", Misdeed::Truncated},
                                                                     {"redirect", Misdeed::Redirect},
                                                                     {"reset", Misdeed::Reset},
                                                                     {"unavailable", Misdeed::Unavailable}}};

constexpr uint64_t hugeBytes = uint64_t{10} << 30;
constexpr std::size_t bombBlocks = 64;
constexpr std::size_t blockBytes = std::size_t{1} << 20;

/// Takes an answer and shows it to nobody.
class Swallowed final : public kj::HttpService::Response, kj::AsyncOutputStream {
public:
    kj::Own<kj::AsyncOutputStream> send(kj::uint, kj::StringPtr, kj::HttpHeaders const &,
                                        kj::Maybe<uint64_t>) override {
        return {static_cast<kj::AsyncOutputStream *>(this), kj::NullDisposer::instance};
    }
    kj::Own<kj::WebSocket> acceptWebSocket(kj::HttpHeaders const &) override {
        // NOLINTNEXTLINE(bugprone-suspicious-semicolon): the macro ends in a loop
        KJ_UNIMPLEMENTED("no operation is a WebSocket");
    }

private:
    kj::Promise<void> write(void const *, size_t) override {
        return kj::READY_NOW;
    }
    kj::Promise<void> write(kj::ArrayPtr<kj::ArrayPtr<kj::byte const> const>) override {
        return kj::READY_NOW;
    }
    kj::Promise<void> whenWriteDisconnected() override {
        return kj::NEVER_DONE;
    }
};

kj::Promise<void> sendText(kj::HttpService::Response &response, unsigned status, kj::StringPtr statusText,
                           kj::HttpHeaders const &headers, kj::StringPtr text) {
    auto stream = response.send(status, statusText, headers, text.size());
    auto promise = stream->write(text.begin(), text.size());
    return promise.attach(kj::mv(stream));
}

kj::Array<kj::byte> bomb() {
    kj::VectorOutputStream packed;
    {
        kj::GzipOutputStream gzip(packed);
        std::string const block(blockBytes, ' ');
        for (std::size_t count = 0; count < bombBlocks; ++count) {
            gzip.write(block.data(), block.size());
        }
    }
    return kj::heapArray<kj::byte>(packed.getArray());
}

} // namespace

std::optional<Misdeed> misdeedNamed(std::string const &name) {
    auto const *const found =
        std::find_if(misdeeds.begin(), misdeeds.end(), [&](auto const &misdeed) { return misdeed.first == name; });
    return found == misdeeds.end() ? std::nullopt : std::optional(found->second);
}

std::vector<std::string> misdeedNames() {
    std::vector<std::string> names;
    for (auto const &misdeed : misdeeds) {
        names.emplace_back(misdeed.first);
    }
    return names;
}

Misbehaviour::Misbehaviour(kj::HttpService &inner, kj::Timer &timer, MisbehaviourSpec spec)
    : inner_(inner)
    , timer_(timer)
    , spec_(std::move(spec))
    , random_(spec_.seed)
    , table_(kj::HttpHeaderTable::Builder().build()) {}

bool Misbehaviour::isToBeHit(std::string const &operation) {
    if (!spec_.misdeed || (!spec_.operation.empty() && spec_.operation != operation) ||
        (spec_.times && hits_ >= *spec_.times)) {
        return false;
    }
    ++hits_;
    return true;
}

bool Misbehaviour::isToFail() {
    return spec_.errorRate > 0 && random_() % 100 < static_cast<uint64_t>(spec_.errorRate);
}

kj::Promise<void> Misbehaviour::request(kj::HttpMethod method, kj::StringPtr url, kj::HttpHeaders const &headers,
                                        kj::AsyncInputStream &requestBody, Response &response) {
    auto address = kj::heapString(url);
    std::string_view const path(address.cStr());
    std::string const operation(path.substr(std::min(path.rfind('/'), path.size() - 1) + 1));
    std::optional<Misdeed> misdeed;
    if (isToBeHit(operation)) {
        misdeed = spec_.misdeed;
    } else if (isToFail()) {
        misdeed = Misdeed::Unavailable;
    }
    auto copy = kj::heap<kj::HttpHeaders>(headers.clone());
    auto &kept = *copy;
    auto const go = [this, misdeed, method, &kept, &requestBody, &response, url = address.asPtr()] {
        return misdeed ? commit(*misdeed, method, url, kept, requestBody, response)
                       : inner_.request(method, url, kept, requestBody, response);
    };
    auto promise = spec_.latency > 0 * kj::SECONDS ? timer_.afterDelay(spec_.latency).then(go) : go();
    return promise.attach(kj::mv(copy), kj::mv(address));
}

kj::Promise<void> Misbehaviour::sendForEver(kj::Own<kj::AsyncOutputStream> stream, std::string block,
                                            kj::Duration pause) {
    auto text = kj::heapString(block.data(), block.size());
    auto promise = stream->write(text.begin(), text.size());
    return promise.attach(kj::mv(text))
        .then([this, pause] { return timer_.afterDelay(pause); })
        .then([this, stream = kj::mv(stream), block = std::move(block), pause]() mutable {
            return sendForEver(kj::mv(stream), std::move(block), pause);
        });
}

kj::Promise<void> Misbehaviour::commit(Misdeed misdeed, kj::HttpMethod method, kj::StringPtr url,
                                       kj::HttpHeaders const &headers, kj::AsyncInputStream &requestBody,
                                       Response &response) {
    kj::HttpHeaders answer(*table_);
    answer.set(kj::HttpHeaderId::CONTENT_TYPE, "application/json");
    switch (misdeed) {
    case Misdeed::Hang:
        return kj::NEVER_DONE;
    case Misdeed::Drip:
        return sendForEver(response.send(200, "OK", answer), " ", 1 * kj::SECONDS);
    case Misdeed::Endless:
        return sendForEver(response.send(200, "OK", answer), std::string(blockBytes, ' '), 0 * kj::SECONDS);
    case Misdeed::Huge:
        return sendForEver(response.send(200, "OK", answer, hugeBytes), std::string(blockBytes, ' '), 0 * kj::SECONDS);
    case Misdeed::Bomb: {
        answer.add("Content-Encoding", "gzip");
        auto body = bomb();
        auto stream = response.send(200, "OK", answer, body.size());
        auto promise = stream->write(body.begin(), body.size());
        return promise.attach(kj::mv(stream), kj::mv(body));
    }
    case Misdeed::Garbage:
        return sendText(response, 200, "OK", answer, "\x01\xff no JSON \xfe");
    case Misdeed::Truncated:
        return sendText(response, 200, "OK", answer, R"({"version": "1", "unchanged": false, "items": [{"na)");
    case Misdeed::Redirect:
        answer.add("Location", "/elsewhere");
        return sendText(response, 307, "Temporary Redirect", answer, "{}");
    case Misdeed::Reset: {
        auto swallowed = kj::heap<Swallowed>();
        auto &nobody = *swallowed;
        return inner_.request(method, url, headers, requestBody, nobody).attach(kj::mv(swallowed)).then([] {
            kj::throwFatalException(KJ_EXCEPTION(DISCONNECTED, "the connection breaks at will"));
        });
    }
    case Misdeed::Unavailable:
        return sendText(response, 503, "Service Unavailable", answer,
                        R"({"error": {"code": "busy", "message": "the array is overloaded"}})");
    }
    KJ_UNREACHABLE;
}

} // namespace Orkasim
