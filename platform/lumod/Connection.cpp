// SPDX-License-Identifier: Apache-2.0
#include "Connection.h"

#include <algorithm>
#include <utility>

#include <capnp/serialize-async.h>
#include <fmt/format.h>

#include "Broken.h"
#include "Escape.h"
#include "RequestCheck.h"
#include "wire/Limits.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

constexpr kj::Duration longestDeadline = 1 * kj::HOURS;
/// How long a peer may take for one message of an answer.
constexpr kj::Duration writePatience = 30 * kj::SECONDS;
/// A buffer that grew for a long request is given back after it.
constexpr std::size_t keptBufferBytes = std::size_t{64} << 10;
/// What a message takes besides its list, and what an estimate may be short by.
constexpr std::size_t messageWords = 1024;

/// A first segment with room for about so many bytes: a message of one segment is the quickest to read.
unsigned segmentWords(std::size_t bytes) {
    return static_cast<unsigned>(messageWords + bytes / sizeof(capnp::word) * 9 / 8);
}

/// The client stops waiting at its deadline, so ours are before it: providers first, who can say what they were doing,
/// then whatever else hangs.
struct Deadlines {
    kj::TimePoint providers;
    kj::TimePoint end;

    Deadlines(kj::TimePoint now, uint32_t clientMs)
        : providers(now)
        , end(now) {
        kj::Duration const asked =
            clientMs == 0 ? Wire::defaultDeadline.count() * kj::MILLISECONDS : clientMs * kj::MILLISECONDS;
        kj::Duration const whole = std::min(asked, longestDeadline);
        kj::Duration const margin = std::min(whole / 10, 500 * kj::MILLISECONDS);
        providers = now + whole - margin;
        end = now + whole - margin / 2;
    }
};

} // namespace

Connection::Connection(Core &core, Shutdown &shutdown, kj::Own<kj::AsyncIoStream> stream, bool ordered, uint64_t number)
    : core_(core)
    , shutdown_(shutdown)
    , stream_(kj::mv(stream))
    , ordered_(ordered)
    , number_(number)
    , reader_(*stream_, core.timer) {}

kj::Promise<void> Connection::run() {
    auto drained = shutdown_.draining().then([] { return Outcome<bool>(false); });
    return reader_.next().exclusiveJoin(kj::mv(drained)).then([this](Outcome<bool> &&got) -> kj::Promise<void> {
        if (!got.ok()) {
            core_.log.write(LogLevel::Warning, "-",
                            fmt::format("closed connection {}: {}", number_, got.failure().sentence()));
            return kj::READY_NOW;
        }
        if (!got.value()) {
            return kj::READY_NOW;
        }
        return answer().then([this]() -> kj::Promise<void> {
            message_ = nullptr;
            if (reader_.buffer().capacityBytes() > keptBufferBytes) {
                reader_.buffer().release();
            }
            // Later: a client that sends without a pause lets the others have their turn.
            return shutdown_.isDraining() ? kj::Promise<void>(kj::READY_NOW) : kj::evalLater([this] { return run(); });
        });
    });
}

Wire::Request::Reader Connection::parse(uint64_t &id) {
    try {
        Wire::MessageBuffer &buffer = reader_.buffer();
        auto message =
            kj::heap<capnp::SegmentArrayMessageReader>(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
        auto const request = message->getRoot<Wire::Request>();
        id = request.getId();
        // Visits everything, also what this version does not know, so that no handler meets a bad pointer half-way.
        request.totalSize();
        // By a reader of its own, so that the handler's may still visit each word as often as it may.
        capnp::SegmentArrayMessageReader checked(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
        readWhole(checked.getRoot<Wire::Request>());
        message_ = kj::mv(message);
        return request;
    } catch (kj::Exception const &exception) {
        throw Failure(ErrorCode::InvalidRequest,
                      fmt::format("the request is malformed: {}", exception.getDescription().cStr()));
    }
}

kj::Promise<void> Connection::answer() {
    uint64_t id = 0;
    Wire::Request::Reader request;
    try {
        request = parse(id);
    } catch (Failure const &failure) {
        core_.log.write(LogLevel::Warning, "-", fmt::format("connection {}: {}", number_, failure.sentence()));
        return sendFailure(id, failure);
    }
    std::string trace = textOf(request.getTraceId());
    if (trace.empty()) {
        trace = fmt::format("connection-{}-{}", number_, id);
    }
    Deadlines const deadlines(core_.timer.now(), request.getDeadlineMs());
    auto const call = std::make_shared<Call const>(Call{std::move(trace), deadlines.providers, ordered_});
    return handle(request, call, deadlines.end)
        .then([this, id, call, request](Outcome<ReplyPtr> &&outcome) -> kj::Promise<void> {
            if (outcome.ok()) {
                return sendAll(id, std::move(outcome).value());
            }
            logFailure(call, request, outcome.failure());
            return sendFailure(id, outcome.failure());
        });
}

Answer<ReplyPtr> Connection::handle(Wire::Request::Reader request, CallPtr const &call, kj::TimePoint end) {
    auto handled = kj::evalNow([&] {
                       return dispatch(core_, call, request);
                   }).catch_([](kj::Exception &&exception) -> Outcome<ReplyPtr> {
        return brokenBy(exception, "the request failed");
    });
    auto tooLate = core_.timer.atTime(end).then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::DeadlineExceeded, "the daemon did not finish the request before its deadline");
    });
    auto givenUp = shutdown_.givingUp().then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::ShuttingDown, "the daemon is shutting down and did not finish the request");
    });
    auto bounded = handled.exclusiveJoin(kj::mv(tooLate)).exclusiveJoin(kj::mv(givenUp));
    Method const *const method = methodOf(request);
    if (method == nullptr || !method->mayBeAbandoned) {
        return bounded;
    }
    auto abandoned = stream_->whenWriteDisconnected().then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::ConnectionLost, "the client went away before it was answered");
    });
    return bounded.exclusiveJoin(kj::mv(abandoned));
}

void Connection::logFailure(CallPtr const &call, Wire::Request::Reader request, Failure const &failure) {
    Method const *const method = methodOf(request);
    core_.log.write(LogLevel::Info, call->trace,
                    fmt::format("{} failed with code {}: {}", method == nullptr ? "a request" : method->name,
                                static_cast<int32_t>(failure.code()), failure.sentence()));
}

kj::Promise<void> Connection::sendAll(uint64_t id, ReplyPtr source) {
    auto message = kj::heap<capnp::MallocMessageBuilder>(segmentWords(source->nextBytes()));
    auto reply = message->initRoot<Wire::Reply>();
    reply.setId(id);
    bool const more = source->next(reply);
    reply.setLast(!more);
    if (capnp::computeSerializedSizeInWords(*message) * sizeof(capnp::word) > Wire::replyBytesMax) {
        return sendFailure(
            id, Failure(ErrorCode::MessageTooLarge, "the answer holds an element that is too large for one message"));
    }
    auto sent = write(kj::mv(message));
    return more ? sent.then([this, id, source = std::move(source)]() mutable { return sendAll(id, std::move(source)); })
                : kj::mv(sent);
}

kj::Promise<void> Connection::sendFailure(uint64_t id, Failure const &failure) {
    auto message = kj::heap<capnp::MallocMessageBuilder>(messageWords);
    auto reply = message->initRoot<Wire::Reply>();
    reply.setId(id);
    auto builder = reply.initFailure();
    builder.setCode(static_cast<int32_t>(failure.code()));
    builder.setSentence(onOneLine(failure.sentence()).c_str());
    return write(kj::mv(message));
}

kj::Promise<void> Connection::write(kj::Own<capnp::MallocMessageBuilder> message) {
    auto written = capnp::writeMessage(*stream_, *message);
    return core_.timer.timeoutAfter(writePatience, kj::mv(written)).attach(kj::mv(message));
}

} // namespace Lumod
