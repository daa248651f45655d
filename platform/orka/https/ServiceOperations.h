// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

#include "https/BodyReader.h"
#include "https/BodyWriter.h"
#include "orka/Service.h"

namespace Orka {

/// From an operation's name and a request's body to the provider and back to an answer's body.
struct ServiceOperations {
    ProviderService &service;

    using Work = kj::Promise<Outcome<std::string>> (*)(ServiceOperations, std::string const &body);
    /// Null for a name that no operation has.
    static Work named(std::string_view operation);

    /// Stands for a page that is not held any more; goes out under a name of its own.
    static constexpr Wire::ErrorCode stalePageCode = Wire::ErrorCode::InvalidRequest;

    Provider &provider() const {
        return service.provider_;
    }
    std::string const &instance() const {
        return service.instance_;
    }
    CallContext contextOf(Https::Envelope const &envelope) const;

    /// Reads a request and hands it to `function(context, request)`.
    template <typename Request, typename Function>
    auto on(std::string const &body, Function &&function) const {
        Https::Envelope envelope;
        Request request;
        Https::readBody(body, "the request", envelope, request);
        return function(contextOf(envelope), std::move(request));
    }

    /// The page that a token names. @throws Wire::Failure stalePageCode
    std::string heldPage(std::string const &page, std::size_t most) const;

    /// The first page; what is left of the list is held for the others.
    template <typename T>
    std::string firstPage(std::shared_ptr<std::vector<T> const> items, std::optional<std::string> version,
                          std::size_t most) const;

private:
    std::string newToken() const;
};

} // namespace Orka
