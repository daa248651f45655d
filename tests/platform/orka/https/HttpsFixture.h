// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <kj/async-io.h>
#include <kj/compat/http.h>
#include <kj/compat/tls.h>
#include <kj/timer.h>

#include "../Fixture.h"
#include "orka/Embedded.h"
#include "orka/ProviderFactory.h"
#include "orka/Service.h"
#include "serve/Certificate.h"
#include "serve/Misbehaviour.h"

/// A network in memory with one host on it. Connections are real to those who use them; time is virtual.
class FakeNetwork final : public kj::Network {
public:
    enum class Way { Open, LookupHangs, LookupFails, Refuses, Silent };

    kj::Promise<kj::Own<kj::NetworkAddress>> parseAddress(kj::StringPtr address, kj::uint port) override;
    kj::Own<kj::NetworkAddress> getSockaddr(void const *, kj::uint) override;
    kj::Own<kj::Network> restrictPeers(kj::ArrayPtr<kj::StringPtr const>, kj::ArrayPtr<kj::StringPtr const>) override;

    kj::Promise<kj::Own<kj::AsyncIoStream>> connect();

    Way way = Way::Open;
    std::function<void(kj::Own<kj::AsyncIoStream>)> onConnection;
    int lookups = 0;
    int connections = 0;
    std::string lastAddress;
};

/// A provider behind HTTPS in the same process, its client, and a clock that jumps to whatever happens next.
class HttpsTest : public OrkaTest {
protected:
    static constexpr char const *url = "https://array.test:8443/orka";

    HttpsTest();
    ~HttpsTest() noexcept override;

    /// Serves the array file; the certificate speaks for array.test unless told otherwise, and is pinned.
    void serve(Orkasim::MisbehaviourSpec spec = {}, std::optional<Orkasim::CertificateSpec> certificate = std::nullopt);
    /// Serves one answer to every request, whatever was asked.
    void serveText(unsigned status, std::string body, std::string type = "application/json");
    void serveWith(kj::HttpService &service, Orkasim::CertificateSpec const &certificate);
    void misbehave(Orkasim::Misdeed misdeed, std::optional<int64_t> times = std::nullopt);
    void pin(std::string const &pem, std::string const &name = "array.test_8443.pem");

    std::unique_ptr<Orka::Provider> newClient(std::string const &address = url);
    Orka::CallContext context(std::string key = "", kj::Duration time = 30 * kj::SECONDS);

    template <typename T>
    Orka::Outcome<T> outcome(kj::Promise<Orka::Outcome<T>> promise) {
        auto const begun = timer_.now();
        while (!promise.poll(wait_)) {
            KJ_IF_MAYBE (next, timer_.nextEvent()) {
                timer_.advanceTo(*next);
            } else {
                ADD_FAILURE() << "nothing will ever happen again";
                return Wire::Failure(Wire::ErrorCode::InternalError, "nothing will ever happen again");
            }
        }
        took_ = timer_.now() - begun;
        return promise.wait(wait_);
    }
    template <typename T>
    T get(kj::Promise<Orka::Outcome<T>> promise) {
        return outcome(std::move(promise)).value();
    }
    template <typename T>
    std::string sentence(kj::Promise<Orka::Outcome<T>> promise) {
        auto const result = outcome(std::move(promise));
        code_ = result.ok() ? Wire::ErrorCode::Success : result.failure().code();
        return result.ok() ? "" : result.failure().sentence();
    }

    class Counting;
    class FixedText;

    kj::EventLoop loop_;
    kj::WaitScope wait_{loop_};
    kj::TimerImpl timer_{kj::origin<kj::TimePoint>()};
    FakeNetwork network_;
    std::unique_ptr<Orka::EmbeddedProvider> embedded_;
    std::unique_ptr<Orka::ProviderService> service_;
    std::unique_ptr<Counting> counting_;
    std::unique_ptr<FixedText> fixed_;
    std::unique_ptr<Orkasim::Misbehaviour> misbehaviour_;
    kj::Own<kj::HttpHeaderTable> table_;
    std::unique_ptr<kj::TlsContext> tls_;
    std::unique_ptr<kj::HttpServer> server_;
    kj::Vector<kj::Promise<void>> serving_;
    std::unique_ptr<Orka::Provider> client_;
    int requests_ = 0; ///< that reached the service
    kj::Duration took_ = 0 * kj::SECONDS;
    Wire::ErrorCode code_ = Wire::ErrorCode::Success;
};
