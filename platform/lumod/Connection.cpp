// SPDX-License-Identifier: Apache-2.0
#include "Connection.h"

#include <algorithm>
#include <utility>

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
/// How long a peer may take to send a request that it has begun.
constexpr kj::Duration readPatience = 10 * kj::SECONDS;
/// How long a peer may take for one message of an answer.
constexpr kj::Duration writePatience = 30 * kj::SECONDS;
/// A message whose list is longer is built in room of its own.
constexpr std::size_t smallReplyBytes = std::size_t{4} << 10;

constexpr char const *requestFailed = "the request failed";

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

kj::Promise<void> promiseOf(kj::Maybe<kj::Promise<void>> rest) {
    KJ_IF_MAYBE (promise, rest) {
        return kj::mv(*promise);
    }
    return kj::READY_NOW;
}

struct LongReply {
    LongReply(std::size_t bytes, uint64_t id)
        : room(bytes)
        , message(room, id) {}

    ReplyRoom room;
    ReplyMessage message; ///< leaves the room clean, so it ends first
};

/// Builds the next message of an answer. @return whether more follow @throws Failure MessageTooLarge
bool fill(ReplyMessage &message, ReplySource &source) {
    bool const more = source.next(message.reply());
    message.reply().setLast(!more);
    if (message.framed().size() > Wire::replyBytesMax) {
        throw Failure(ErrorCode::MessageTooLarge, "the answer holds an element that is too large for one message");
    }
    return more;
}

} // namespace

Connection::Connection(Core &core, Shutdown &shutdown, ReplyRoom &room, kj::UnixEventPort &port, kj::AutoCloseFd socket,
                       bool ordered, uint64_t number)
    : core_(core)
    , shutdown_(shutdown)
    , room_(room)
    , socket_(port, kj::mv(socket))
    , ordered_(ordered)
    , number_(number)
    , reader_(socket_) {}

kj::Promise<void> Connection::run() {
    auto drained = shutdown_.draining().then(
        [this] { return isAnswering_ ? kj::Promise<void>(kj::NEVER_DONE) : kj::Promise<void>(kj::READY_NOW); });
    return serve().exclusiveJoin(kj::mv(drained));
}

kj::Promise<void> Connection::serve() {
    try {
        MessageReader::Progress progress = reader_.advance();
        if (progress == MessageReader::Progress::Whole) {
            KJ_IF_MAYBE (rest, answer()) {
                isAnswering_ = true;
                return rest->then([this] {
                    isAnswering_ = false;
                    dropRequest();
                    return shutdown_.isDraining() ? kj::Promise<void>(kj::READY_NOW) : serveLater();
                });
            }
            dropRequest();
            progress = reader_.advance();
        }
        switch (progress) {
        case MessageReader::Progress::Whole:
            return serveLater();
        case MessageReader::Progress::Waiting:
            return waitForMore();
        case MessageReader::Progress::Closed:
            break;
        }
    } catch (Failure const &failure) {
        logClosed(failure);
    }
    return kj::READY_NOW;
}

kj::Promise<void> Connection::serveLater() {
    return kj::evalLater([this] { return serve(); });
}

kj::Promise<void> Connection::waitForMore() {
    if (!reader_.hasBegun()) {
        return socket_.readable().then([this] { return serve(); });
    }
    // One deadline for the whole message: a byte now and then does not move it.
    if (!requestDue_) {
        requestDue_ = core_.timer.now() + readPatience;
    }
    auto tooSlow = core_.timer.atTime(*requestDue_).then([] { return false; });
    auto came = socket_.readable().then([] { return true; });
    return came.exclusiveJoin(kj::mv(tooSlow)).then([this](bool hasCome) {
        if (hasCome) {
            return serve();
        }
        logClosed(Failure(ErrorCode::DeadlineExceeded, "a request was begun and not finished in time"));
        return kj::Promise<void>(kj::READY_NOW);
    });
}

void Connection::logClosed(Failure const &failure) {
    core_.log.write(LogLevel::Warning, "-", fmt::format("closed connection {}: {}", number_, failure.sentence()));
}

void Connection::dropRequest() {
    message_.reset();
    reader_.drop();
    requestDue_.reset();
}

Wire::Request::Reader Connection::parse(uint64_t &id) {
    try {
        auto const segments = reader_.segments();
        capnp::ReaderOptions const options = Wire::readerOptions(reader_.bodyBytes());
        auto const request = message_.emplace(segments, options).getRoot<Wire::Request>();
        id = request.getId();
        // Visits everything, also what this version does not know, so that no handler meets a bad pointer half-way.
        request.totalSize();
        // By a reader of its own, so that the handler's may still visit each word as often as it may.
        capnp::SegmentArrayMessageReader checked(segments, options);
        readWhole(checked.getRoot<Wire::Request>());
        return request;
    } catch (kj::Exception const &exception) {
        throw Failure(ErrorCode::InvalidRequest,
                      fmt::format("the request is malformed: {}", exception.getDescription().cStr()));
    }
}

Connection::Rest Connection::answer() {
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
    std::optional<Dispatched> dispatched;
    KJ_IF_MAYBE (exception, kj::runCatchingExceptions([&] { dispatched = dispatch(core_, call, request); })) {
        dispatched = Outcome<ReplyPtr>(brokenBy(*exception, requestFailed));
    }
    if (auto *outcome = std::get_if<Outcome<ReplyPtr>>(&*dispatched)) {
        return reply(id, call, request, std::move(*outcome));
    }
    auto answered = bounded(std::get<Answer<ReplyPtr>>(*std::move(dispatched)), request, deadlines.end);
    return answered.then([this, id, call, request](Outcome<ReplyPtr> &&outcome) {
        return promiseOf(reply(id, call, request, std::move(outcome)));
    });
}

Answer<ReplyPtr> Connection::bounded(Answer<ReplyPtr> answer, Wire::Request::Reader request, kj::TimePoint end) {
    auto handled = answer.catch_(
        [](kj::Exception &&exception) -> Outcome<ReplyPtr> { return brokenBy(exception, requestFailed); });
    auto tooLate = core_.timer.atTime(end).then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::DeadlineExceeded, "the daemon did not finish the request before its deadline");
    });
    auto givenUp = shutdown_.givingUp().then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::ShuttingDown, "the daemon is shutting down and did not finish the request");
    });
    auto ended = handled.exclusiveJoin(kj::mv(tooLate)).exclusiveJoin(kj::mv(givenUp));
    Method const *const method = methodOf(request);
    if (method == nullptr || !method->mayBeAbandoned) {
        return ended;
    }
    auto abandoned = socket_.disconnected().then([]() -> Outcome<ReplyPtr> {
        return Failure(ErrorCode::ConnectionLost, "the client went away before it was answered");
    });
    return ended.exclusiveJoin(kj::mv(abandoned));
}

Connection::Rest Connection::reply(uint64_t id, CallPtr const &call, Wire::Request::Reader request,
                                   Outcome<ReplyPtr> outcome) {
    if (outcome.ok()) {
        return sendAll(id, std::move(outcome).value());
    }
    logFailure(call, request, outcome.failure());
    return sendFailure(id, outcome.failure());
}

void Connection::logFailure(CallPtr const &call, Wire::Request::Reader request, Failure const &failure) {
    Method const *const method = methodOf(request);
    core_.log.write(LogLevel::Info, call->trace,
                    fmt::format("{} failed with code {}: {}", method == nullptr ? "a request" : method->name,
                                static_cast<int32_t>(failure.code()), failure.sentence()));
}

Connection::Rest Connection::sendAll(uint64_t id, ReplyPtr source) {
    try {
        for (;;) {
            if (source->nextBytes() > smallReplyBytes) {
                return sendLong(id, std::move(source));
            }
            ReplyMessage message(room_, id);
            bool const more = fill(message, *source);
            Rest rest = send(message);
            if (!more) {
                return rest;
            }
            KJ_IF_MAYBE (taken, rest) {
                return sendAllAfter(kj::mv(*taken), id, std::move(source));
            }
        }
    } catch (Failure const &failure) {
        return sendFailure(id, failure);
    }
}

kj::Promise<void> Connection::sendLong(uint64_t id, ReplyPtr source) {
    auto built = kj::heap<LongReply>(source->nextBytes(), id);
    bool const more = fill(built->message, *source);
    auto taken = inTime(socket_.sendAll(built->message.framed())).attach(kj::mv(built));
    return more ? sendAllAfter(kj::mv(taken), id, std::move(source)) : kj::mv(taken);
}

kj::Promise<void> Connection::sendAllAfter(kj::Promise<void> taken, uint64_t id, ReplyPtr source) {
    return taken.then(
        [this, id, source = std::move(source)]() mutable { return promiseOf(sendAll(id, std::move(source))); });
}

Connection::Rest Connection::sendFailure(uint64_t id, Failure const &failure) {
    ReplyMessage message(room_, id);
    auto builder = message.reply().initFailure();
    builder.setCode(static_cast<int32_t>(failure.code()));
    builder.setSentence(onOneLine(failure.sentence()).c_str());
    return send(message);
}

Connection::Rest Connection::send(ReplyMessage &message) {
    kj::ArrayPtr<kj::byte const> const bytes = message.framed();
    std::size_t const sent = socket_.send(bytes);
    if (sent == bytes.size()) {
        return nullptr;
    }
    kj::Array<kj::byte> rest = kj::heapArray(bytes.slice(sent, bytes.size()));
    return inTime(socket_.sendAll(rest)).attach(kj::mv(rest));
}

kj::Promise<void> Connection::inTime(kj::Promise<void> taken) {
    return core_.timer.timeoutAfter(writePatience, kj::mv(taken));
}

} // namespace Lumod
