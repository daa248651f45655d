// SPDX-License-Identifier: Apache-2.0
#include "orka/Service.h"

#include <fmt/format.h>

#include "RandomUuid.h"
#include "https/Bytes.h"
#include "https/HeldLists.h"
#include "https/Protocol.h"
#include "https/ServiceOperations.h"

namespace Orka {

using namespace Https;

namespace {

constexpr std::string_view statusTextOf(unsigned status) {
    switch (status) {
    case statusDone:
        return "OK";
    case statusBadRequest:
        return "Bad Request";
    case statusNotFound:
        return "Not Found";
    case statusMethodNotAllowed:
        return "Method Not Allowed";
    case statusConflict:
        return "Conflict";
    case statusTooLarge:
        return "Content Too Large";
    case statusUnsupportedMediaType:
        return "Unsupported Media Type";
    case statusUnavailable:
        return "Service Unavailable";
    case statusGatewayTimeout:
        return "Gateway Timeout";
    case statusForbidden:
        return "Forbidden";
    case statusNotImplemented:
        return "Not Implemented";
    default:
        return "Internal Server Error";
    }
}

/// A token and a function each: what counts is their elements.
constexpr std::size_t heldListsMax = 10000;

std::string errorBody(std::string_view code, std::string const &message) {
    return bodyOf(ErrorAnswer{{std::string(code), message}});
}

} // namespace

ProviderService::ProviderService(Provider &provider, kj::Timer &timer, std::string path, std::string instance)
    : provider_(provider)
    , timer_(timer)
    , path_(std::move(path))
    , instance_(instance.empty() ? randomUuid() : std::move(instance))
    , held_(std::make_unique<HeldLists>(HeldLimits{heldListsMax, listItemsMax})) {}

ProviderService::~ProviderService() noexcept = default;

kj::Own<kj::HttpHeaderTable> ProviderService::headerTable() {
    return kj::HttpHeaderTable::Builder().build();
}

kj::Promise<void> ProviderService::request(kj::HttpMethod method, kj::StringPtr url, kj::HttpHeaders const &headers,
                                           kj::AsyncInputStream &requestBody, Response &response) {
    std::string_view path(url.cStr(), url.size());
    auto const refuse = [&](unsigned status, std::string_view code, std::string const &message) {
        return send(response, {status, errorBody(code, message)});
    };
    if (path.substr(0, path_.size()) != path_ || path.substr(path_.size(), versionSegment.size()) != versionSegment) {
        return refuse(statusNotFound, unknownVersion,
                      fmt::format("there is nothing at this path; operations are at {}{}", path_, versionSegment));
    }
    if (method != kj::HttpMethod::POST) {
        return refuse(statusMethodNotAllowed, "invalidArgument", "an operation is asked for by POST");
    }
    if (!isJson(headers)) {
        return refuse(statusUnsupportedMediaType, "invalidArgument", "a request's body is application/json");
    }
    std::string operation(path.substr(path_.size() + versionSegment.size()));
    return readUpTo(requestBody, requestBytesMax)
        .then(
            [this, operation = std::move(operation)](std::optional<std::string> &&body) -> kj::Promise<Reply> {
                if (!body) {
                    return Reply{statusTooLarge, errorBody("tooLarge", "a request's body may have 1 MiB")};
                }
                return answer(operation, *std::move(body));
            },
            [](kj::Exception &&exception) -> kj::Promise<Reply> {
                if (exception.getType() == kj::Exception::Type::DISCONNECTED) {
                    return kj::mv(exception);
                }
                return Reply{statusBadRequest, errorBody("invalidArgument", "the request's body is not HTTP")};
            })
        .then([this, &response](Reply &&reply) { return send(response, reply); });
}

kj::Promise<void> ProviderService::handleClientProtocolError(kj::HttpHeaders::ProtocolError error, Response &response) {
    return send(response, {error.statusCode, errorBody("invalidArgument", fmt::format("the request cannot be read: {}",
                                                                                      error.description.cStr()))});
}

kj::Promise<void> ProviderService::handleApplicationError(kj::Exception exception, kj::Maybe<Response &> response) {
    if (exception.getType() != kj::Exception::Type::DISCONNECTED) {
        KJ_IF_MAYBE (open, response) {
            return send(*open, {statusBroken, errorBody("arrayFailure", "the request could not be carried out")});
        }
    }
    return kj::READY_NOW;
}

bool ProviderService::serves(std::string_view operation) {
    return ServiceOperations::named(operation) != nullptr;
}

kj::Promise<ProviderService::Reply> ProviderService::answer(std::string_view operation, std::string body) {
    auto const work = ServiceOperations::named(operation);
    if (work == nullptr) {
        return Reply{statusNotFound,
                     errorBody(unknownOperation, fmt::format("there is no operation {}", quoted(operation)))};
    }
    auto promise = [&]() -> kj::Promise<Outcome<std::string>> {
        auto begun = outcomeOf([&] { return work(ServiceOperations{*this}, body); });
        if (!begun.ok()) {
            return Outcome<std::string>(begun.failure());
        }
        return std::move(begun).value();
    }();
    return promise.then([](Outcome<std::string> &&outcome) -> Reply {
        if (outcome.ok()) {
            return {statusDone, std::move(outcome).value()};
        }
        auto const &failure = outcome.failure();
        if (failure.code() == ServiceOperations::stalePageCode) {
            return {statusConflict, errorBody(stalePage, failure.sentence())};
        }
        auto const &name = nameOf(failure.code());
        return {name.status, errorBody(name.name, failure.sentence())};
    });
}

kj::Promise<void> ProviderService::send(Response &response, Reply const &reply) const {
    auto body = kj::heapString(reply.body.data(), reply.body.size());
    auto const table = kj::HttpHeaderTable::Builder().build();
    kj::HttpHeaders headers(*table);
    headers.set(kj::HttpHeaderId::CONTENT_TYPE, jsonType);
    auto stream = response.send(reply.status,
                                kj::heapString(statusTextOf(reply.status).data(), statusTextOf(reply.status).size()),
                                headers, body.size());
    auto promise = stream->write(body.begin(), body.size());
    return promise.attach(kj::mv(stream), kj::mv(body));
}

} // namespace Orka
