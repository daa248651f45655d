// SPDX-License-Identifier: Apache-2.0
//
// The serving end of the provider protocol: what an HTTP server gives a request to, in front of any provider. The array
// simulator serves an array file with it, tests serve what they like.
//
// It believes a client as little as a client believes it: bodies are bounded, checked and refused with a sentence. It
// holds the lists whose pages somebody may still ask for, as many elements as one list may have. Requests are
// independent of each other; what the provider beneath keeps in order is in order.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include <kj/compat/http.h>
#include <kj/timer.h>

#include "orka/Provider.h"

namespace Orka {

namespace Https {
class HeldLists;
}

class ProviderService final : public kj::HttpService, public kj::HttpServerErrorHandler {
public:
    /// @param provider outlives the service, as does the timer, which is the provider's
    /// @param path what stands before the version in every path, as "/orka"
    /// @param instance differs between any two services that a client may take for the same one; null: a random UUID
    ProviderService(Provider &provider, kj::Timer &timer, std::string path, std::string instance = "");
    ~ProviderService() noexcept;

    /// For the server that this serves under.
    static kj::Own<kj::HttpHeaderTable> headerTable();

    kj::Promise<void> request(kj::HttpMethod method, kj::StringPtr url, kj::HttpHeaders const &headers,
                              kj::AsyncInputStream &requestBody, Response &response) override;

    /// What is no request is answered like one that is refused.
    kj::Promise<void> handleClientProtocolError(kj::HttpHeaders::ProtocolError error, Response &response) override;
    /// Tells a client that it failed, and nothing of this program's inside.
    kj::Promise<void> handleApplicationError(kj::Exception exception, kj::Maybe<Response &> response) override;

    /// Whether there is an operation of this name.
    static bool serves(std::string_view operation);

private:
    friend struct ServiceOperations;

    /// What goes back.
    struct Reply {
        unsigned status;
        std::string body;
    };

    kj::Promise<Reply> answer(std::string_view operation, std::string body);
    kj::Promise<void> send(Response &response, Reply const &reply) const;

    Provider &provider_;
    kj::Timer &timer_;
    std::string path_;
    std::string instance_;
    uint64_t listCount_ = 0;
    std::unique_ptr<Https::HeldLists> held_;
};

} // namespace Orka
