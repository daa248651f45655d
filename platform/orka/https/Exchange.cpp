// SPDX-License-Identifier: Apache-2.0
#include "https/Exchange.h"

#include <string_view>
#include <utility>

#include <fmt/format.h>

#include "https/BodyReader.h"
#include "https/Bytes.h"
#include "https/Protocol.h"

namespace Orka::Https {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

constexpr int triesMax = 4;
constexpr kj::Duration firstPause = 100 * kj::MILLISECONDS;
constexpr std::size_t messageBytesMax = 2000;

bool asksForPatience(unsigned status) {
    return status == statusTooManyRequests || status == statusBadGateway || status == statusUnavailable ||
           status == statusGatewayTimeout;
}

/// Cut where a character begins, not within one.
std::string shortened(std::string text) {
    if (text.size() > messageBytesMax) {
        auto end = messageBytesMax;
        while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xc0) == 0x80) {
            --end;
        }
        text.resize(end);
        text += "...";
    }
    return text;
}

} // namespace

Failure Exchange::failure(ErrorCode code, Asked const &asked, std::string const &did) const {
    return {code, fmt::format("the provider at {} answered {} {}", authority(), asked.operation, did)};
}

std::string Exchange::pathOf(Asked const &asked) const {
    return fmt::format("{}{}{}", line_->url().path, versionSegment, asked.operation);
}

Failure Exchange::outOfTime(Asked const &asked) const {
    char const *did = "did not answer {} before the deadline";
    switch (*asked.step) {
    case Step::LookingUp:
        did = "was not found before the deadline of {}: its name is still being looked up";
        break;
    case Step::Connecting:
        did = "accepted no connection before the deadline of {}";
        break;
    case Step::ShakingHands:
        did = "did not agree on TLS before the deadline of {}";
        break;
    case Step::Connected:
        if (asked.isAnswering) {
            did = "did not finish its answer to {} before the deadline";
        }
    }
    if (!asked.lastFailure.empty()) {
        return {ErrorCode::DeadlineExceeded, asked.lastFailure + "; the deadline came before it could be asked again"};
    }
    return {ErrorCode::DeadlineExceeded,
            fmt::format("the provider at {} {}", authority(), fmt::format(fmt::runtime(did), asked.operation))};
}

kj::Promise<Outcome<std::string>> Exchange::ask(std::shared_ptr<Asked> asked) {
    using Result = Outcome<std::string>;
    if (timer_.now() >= asked->deadline) {
        return Result(
            Failure(ErrorCode::DeadlineExceeded,
                    fmt::format("the deadline had passed before the provider at {} could be asked", authority())));
    }
    auto late = timer_.atTime(asked->deadline).then([this, asked]() -> Result { return outOfTime(*asked); });
    int const tries = asked->mayBeRepeated && !isFailing_ ? triesMax : 1;
    return attempts(asked, tries, !asked->mayBeRepeated, firstPause)
        .exclusiveJoin(kj::mv(late))
        .attach(kj::addRef(*this));
}

kj::Promise<Outcome<std::string>> Exchange::attempts(std::shared_ptr<Asked> asked, int left, bool fresh,
                                                     kj::Duration pause) {
    asked->lastFailure.clear();
    asked->isAnswering = false;
    auto trying = attempt(asked, fresh);
    return trying.then([this, asked, left, pause](Attempt &&attempt) -> kj::Promise<Outcome<std::string>> {
        if (attempt.wasStale) {
            return attempts(asked, left, true, pause);
        }
        if (!attempt.isWorthRepeating || left <= 1) {
            isFailing_ = attempt.isWorthRepeating;
            return std::move(attempt.outcome);
        }
        asked->lastFailure = attempt.outcome.failure().sentence();
        return timer_.afterDelay(pause).then(
            [this, asked, left, pause] { return attempts(asked, left - 1, false, 2 * pause); });
    });
}

kj::Promise<Exchange::Attempt> Exchange::attempt(std::shared_ptr<Asked> asked, bool fresh) {
    return line_->connection(fresh, asked->step)
        .then([this, asked](Outcome<kj::Own<Connection>> &&connection) -> kj::Promise<Attempt> {
            if (!connection.ok()) {
                return Attempt{connection.failure()};
            }
            return over(std::move(connection).value(), asked);
        });
}

kj::Promise<Exchange::Attempt> Exchange::over(kj::Own<Connection> connection, std::shared_ptr<Asked> asked) {
    bool const wasUsed = connection->isUsed;
    auto &client = *connection->client;
    return kj::evalNow([&] {
               kj::HttpHeaders headers(line_->headers());
               headers.set(kj::HttpHeaderId::HOST, line_->authority().c_str());
               headers.set(kj::HttpHeaderId::CONTENT_TYPE, jsonType);
               headers.add("Accept", jsonType);
               headers.add("Accept-Encoding", "identity");
               auto const path = pathOf(*asked);
               auto request = client.request(kj::HttpMethod::POST, path.c_str(), headers, asked->body.size());
               auto sending = request.body->write(asked->body.data(), asked->body.size())
                                  .attach(kj::mv(request.body), std::shared_ptr<Asked>(asked))
                                  // Whoever refuses early does not read on; what he answered counts.
                                  .eagerlyEvaluate([](kj::Exception &&) {});
               return request.response.attach(kj::mv(sending));
           })
        .then([this, asked, connection = kj::mv(connection)](kj::HttpClient::Response &&response) mutable {
            return readAnswer(kj::mv(response), kj::mv(connection), asked);
        })
        .catch_([this, asked, wasUsed](kj::Exception &&exception) -> Attempt {
            if (wasUsed && !asked->isAnswering) {
                return {failure(ErrorCode::ProviderUnreachable, *asked, "by closing the connection"), false, true};
            }
            if (exception.getType() == kj::Exception::Type::DISCONNECTED) {
                return {failure(ErrorCode::ProviderUnreachable, *asked,
                                asked->isAnswering ? "in part and then broke the connection"
                                                   : "by breaking the connection"),
                        asked->mayBeRepeated, false};
            }
            return {failure(ErrorCode::ProtocolError, *asked, "with something that is not HTTP")};
        });
}

kj::Promise<Exchange::Attempt> Exchange::readAnswer(kj::HttpClient::Response &&response, kj::Own<Connection> connection,
                                                    std::shared_ptr<Asked> asked) {
    asked->isAnswering = true;
    // Goes before the connection that it comes over, whichever way this ends.
    auto incoming = kj::mv(response.body);
    auto const status = response.statusCode;
    if (status >= 300 && status < 400) {
        return Attempt{
            failure(ErrorCode::ProtocolError, *asked, fmt::format("with a redirect ({}), which is refused", status))};
    }
    KJ_IF_MAYBE (encoding, response.headers->get(line_->contentEncoding())) {
        if (*encoding != "identity") {
            return Attempt{failure(ErrorCode::ProtocolError, *asked, "in an encoding that it was not asked for")};
        }
    }
    bool const hasJson = isJson(*response.headers);
    if (status == statusDone && !hasJson) {
        return Attempt{failure(ErrorCode::ProtocolError, *asked, "with something that is not JSON")};
    }
    bool mayBeKept = true;
    KJ_IF_MAYBE (value, response.headers->get(kj::HttpHeaderId::CONNECTION)) {
        mayBeKept = *value != "close";
    }
    auto &stream = *incoming;
    return readUpTo(stream, answerBytesMax)
        .attach(kj::mv(incoming))
        .then([this, status, hasJson, mayBeKept, asked,
               connection = kj::mv(connection)](std::optional<std::string> &&body) mutable -> Attempt {
            if (!body) {
                return {
                    failure(ErrorCode::ProtocolError, *asked,
                            fmt::format("with more than the {} MiB that an answer may have", answerBytesMax >> 20))};
            }
            if (mayBeKept) {
                line_->keep(kj::mv(connection));
            }
            return judge(status, hasJson ? *std::move(body) : std::string(), *asked);
        });
}

Exchange::Attempt Exchange::judge(unsigned status, std::string body, Asked &asked) const {
    if (status == statusDone) {
        return {std::move(body)};
    }
    ErrorAnswer answer;
    auto const read = outcomeOf([&] {
        readBody(body, "", answer);
        return Done{};
    });
    bool const isWorthRepeating = asksForPatience(status) && asked.mayBeRepeated;
    if (!read.ok()) {
        auto const code = asksForPatience(status) ? ErrorCode::ProviderBusy : ErrorCode::ProtocolError;
        return {failure(code, asked, fmt::format("with status {} and no reason", status)), isWorthRepeating, false};
    }
    asked.pageWasStale = answer.error.code == stalePage;
    auto const *const known = errorNamed(answer.error.code);
    // The array's own words, when it says any: they name what was asked for, not the way to it.
    auto sentence = answer.error.message.empty()
                        ? failure(ErrorCode::IoError, asked, "with the error " + quoted(answer.error.code)).sentence()
                        : shortened(answer.error.message);
    if (answer.error.code == unknownVersion || answer.error.code == unknownOperation) {
        // No array's words: it is the way that is wrong, or the other end is of another release.
        sentence = fmt::format("the provider at {} does not serve {}: {}", authority(), pathOf(asked), sentence);
    }
    return {Failure(known == nullptr ? ErrorCode::IoError : known->code, std::move(sentence)), isWorthRepeating, false};
}

} // namespace Orka::Https
