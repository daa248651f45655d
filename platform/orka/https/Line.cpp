// SPDX-License-Identifier: Apache-2.0
#include "https/Line.h"

#include <string_view>
#include <utility>

#include "orka/SystemReason.h"

namespace Orka::Https {

namespace {

/// Less than servers usually keep one, so that a request seldom meets one that is being closed.
constexpr kj::Duration idleTime = 4 * kj::SECONDS;
constexpr std::size_t idleMax = 4;
/// A lookup that has taken this long is given up for a new one.
constexpr kj::Duration lookupTime = 60 * kj::SECONDS;

bool speaksOfTrust(kj::Exception const &exception) {
    return std::string_view(exception.getDescription().cStr()).find("certificate is not trusted") !=
           std::string_view::npos;
}

/// Whether a certificate is refused for who signed it, not for whom it names or until when it holds.
bool isOfAStranger(std::string const &reason) {
    return reason.find("self-signed") != std::string::npos || reason.find("issuer") != std::string::npos ||
           reason.find("verify the first") != std::string::npos;
}

} // namespace

Line::Line(Url url, std::string const &certificates, kj::Network &network, kj::Timer &timer)
    : url_(std::move(url))
    , authority_(url_.authority())
    , trust_(certificates, url_)
    , network_(network)
    , timer_(timer) {}

Line::Headers::Headers() {
    kj::HttpHeaderTable::Builder builder;
    contentEncoding = builder.add("Content-Encoding");
    table = builder.build();
}

Wire::Failure Line::unreachable(Step step, kj::Exception const &exception) {
    std::string sentence;
    switch (step) {
    case Step::LookingUp:
        sentence = "the provider at " + authority_ + " cannot be found: " + systemReason(exception);
        break;
    case Step::Connecting:
        sentence = "the provider at " + authority_ + " cannot be reached: " + systemReason(exception);
        break;
    default:
        if (speaksOfTrust(exception)) {
            // Whoever mends the system's store is heard at the next try.
            trust_.forget();
            auto const reason = systemReason(exception);
            sentence = "the provider at " + authority_ + " showed a certificate that is not trusted: " + reason;
            if (auto const advice = trust_.advice(); isOfAStranger(reason) && !advice.empty()) {
                sentence += "; " + advice;
            }
        } else {
            sentence = "the provider at " + authority_ + " did not agree on TLS: " + systemReason(exception);
        }
    }
    return {Wire::ErrorCode::ProviderUnreachable, sentence};
}

kj::Promise<void> Line::lookUp() {
    isLookingUp_ = true;
    return network_.parseAddress(authority_.c_str(), url_.port)
        .then(
            [this](kj::Own<kj::NetworkAddress> &&address) {
                found_ = kj::mv(address);
                isLookingUp_ = false;
            },
            [this](kj::Exception &&exception) {
                isLookingUp_ = false;
                kj::throwFatalException(kj::mv(exception));
            });
}

kj::Promise<kj::Own<kj::NetworkAddress>> Line::address() {
    if (!isLookingUp_ || timer_.now() - lookupSince_ > lookupTime) {
        lookupSince_ = timer_.now();
        lookup_ = kj::evalNow([this] { return lookUp(); }).fork();
    }
    return lookup_.addBranch().then([self = kj::addRef(*this)]() mutable { return self->found_->clone(); });
}

kj::Promise<Outcome<kj::Own<Connection>>> Line::connection(bool fresh, std::shared_ptr<Step> step) {
    while (!fresh && !idle_.empty()) {
        auto last = kj::mv(idle_.back());
        idle_.pop_back();
        if (timer_.now() - last->idleSince < idleTime) {
            *step = Step::Connected;
            return Outcome<kj::Own<Connection>>(kj::mv(last));
        }
    }
    return open(std::move(step));
}

kj::Promise<Outcome<kj::Own<Connection>>> Line::open(std::shared_ptr<Step> step) {
    using Result = Outcome<kj::Own<Connection>>;
    *step = Step::LookingUp;
    auto self = kj::addRef(*this);
    auto &line = *self;
    return line.address()
        .then([step](kj::Own<kj::NetworkAddress> &&address) {
            *step = Step::Connecting;
            auto promise = address->connect();
            return promise.attach(kj::mv(address));
        })
        .then([&line, step](kj::Own<kj::AsyncIoStream> &&stream) { return line.secure(kj::mv(stream), step); },
              [&line, step](kj::Exception &&exception) -> kj::Promise<Result> {
                  return Result(line.unreachable(*step, exception));
              })
        .attach(kj::mv(self));
}

kj::Promise<Outcome<kj::Own<Connection>>> Line::secure(kj::Own<kj::AsyncIoStream> stream, std::shared_ptr<Step> step) {
    using Result = Outcome<kj::Own<Connection>>;
    *step = Step::ShakingHands;
    auto securing = outcomeOf([&] { return trust_.secure(kj::mv(stream)); });
    if (!securing.ok()) {
        return Result(securing.failure());
    }
    return std::move(securing).value().then(
        [this, step](kj::Own<kj::AsyncIoStream> &&secured) -> Result {
            *step = Step::Connected;
            auto connection = kj::heap<Connection>();
            connection->client = kj::newHttpClient(headers(), *secured);
            connection->stream = kj::mv(secured);
            return Result(kj::mv(connection));
        },
        [this, step](kj::Exception &&exception) -> Result { return unreachable(*step, exception); });
}

void Line::keep(kj::Own<Connection> connection) {
    connection->isUsed = true;
    connection->idleSince = timer_.now();
    idle_.push_back(kj::mv(connection));
    if (idle_.size() > idleMax) {
        idle_.pop_front();
    }
    if (!isClosing_) {
        isClosing_ = true;
        closing_ = closeIdle().eagerlyEvaluate(nullptr);
    }
}

kj::Promise<void> Line::closeIdle() {
    return timer_.atTime(idle_.front()->idleSince + idleTime).then([this]() -> kj::Promise<void> {
        while (!idle_.empty() && timer_.now() - idle_.front()->idleSince >= idleTime) {
            idle_.pop_front();
        }
        if (idle_.empty()) {
            isClosing_ = false;
            return kj::READY_NOW;
        }
        return closeIdle();
    });
}

} // namespace Orka::Https
