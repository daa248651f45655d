// SPDX-License-Identifier: Apache-2.0
//
// The serving end of the provider protocol: what an HTTP server gives a request to, in front of any provider. The array
// simulator serves an array file with it, tests serve what they like.
//
// It believes a client as little as a client believes it: bodies are bounded, checked and refused with a sentence. It
// holds the lists whose pages somebody may still ask for, the newest 64 of them. Requests are independent of each
// other; what the provider beneath keeps in order is in order.
#pragma once

#include <deque>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <kj/compat/http.h>
#include <kj/timer.h>

#include "orka/Provider.h"

namespace Orka {

class ProviderService final : public kj::HttpService {
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

private:
    friend struct ServiceOperations;

    /// What goes back.
    struct Reply {
        unsigned status;
        std::string body;
    };
    /// A list of which pages are left.
    struct Page {
        std::string body;
        bool isLast;
    };
    struct HeldList {
        std::string token;
        std::function<Page(std::size_t offset, std::size_t most)> page;
    };

    kj::Promise<Reply> answer(std::string_view operation, std::string body);
    kj::Promise<void> send(Response &response, Reply const &reply) const;

    Provider &provider_;
    kj::Timer &timer_;
    std::string path_;
    std::string instance_;
    uint64_t listCount_ = 0;
    std::deque<HeldList> held_;
};

} // namespace Orka
