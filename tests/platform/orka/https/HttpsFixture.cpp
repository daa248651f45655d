// SPDX-License-Identifier: Apache-2.0
#include "HttpsFixture.h"

#include <filesystem>

#include <kj/debug.h>

namespace {

class FakeAddress final : public kj::NetworkAddress {
public:
    explicit FakeAddress(FakeNetwork &network)
        : network_(network) {}
    kj::Promise<kj::Own<kj::AsyncIoStream>> connect() override {
        return network_.connect();
    }
    kj::Own<kj::ConnectionReceiver> listen() override {
        KJ_UNIMPLEMENTED("nobody listens here");
    }
    kj::Own<kj::NetworkAddress> clone() override {
        return kj::heap<FakeAddress>(network_);
    }
    kj::String toString() override {
        return kj::str("fake");
    }

private:
    FakeNetwork &network_;
};

} // namespace

kj::Promise<kj::Own<kj::NetworkAddress>> FakeNetwork::parseAddress(kj::StringPtr address, kj::uint) {
    ++lookups;
    lastAddress = address.cStr();
    if (way == Way::LookupHangs) {
        return kj::NEVER_DONE;
    }
    if (way == Way::LookupFails) {
        return KJ_EXCEPTION(FAILED, "DNS lookup failed.; params.host = array.test; params.service = ; "
                                    "gai_strerror(status) = Name or service not known");
    }
    kj::Own<kj::NetworkAddress> found = kj::heap<FakeAddress>(*this);
    return kj::mv(found);
}

kj::Own<kj::NetworkAddress> FakeNetwork::getSockaddr(void const *, kj::uint) {
    KJ_UNIMPLEMENTED("nobody asks for this");
}

kj::Own<kj::Network> FakeNetwork::restrictPeers(kj::ArrayPtr<kj::StringPtr const>, kj::ArrayPtr<kj::StringPtr const>) {
    KJ_UNIMPLEMENTED("nobody asks for this");
}

kj::Promise<kj::Own<kj::AsyncIoStream>> FakeNetwork::connect() {
    ++connections;
    if (way == Way::Silent) {
        return kj::NEVER_DONE;
    }
    if (way == Way::Refuses) {
        return KJ_EXCEPTION(DISCONNECTED, "connect(): Connection refused");
    }
    auto pipe = kj::newTwoWayPipe();
    onConnection(kj::mv(pipe.ends[0]));
    return kj::mv(pipe.ends[1]);
}

class HttpsTest::Counting final : public kj::HttpService {
public:
    Counting(kj::HttpService &inner, int &count)
        : inner_(inner)
        , count_(count) {}
    kj::Promise<void> request(kj::HttpMethod method, kj::StringPtr address, kj::HttpHeaders const &headers,
                              kj::AsyncInputStream &body, Response &response) override {
        ++count_;
        return inner_.request(method, address, headers, body, response);
    }

private:
    kj::HttpService &inner_;
    int &count_;
};

class HttpsTest::FixedText final : public kj::HttpService {
public:
    FixedText(unsigned status, std::string body, std::string type)
        : status_(status)
        , body_(std::move(body))
        , type_(std::move(type)) {}
    kj::Promise<void> request(kj::HttpMethod, kj::StringPtr, kj::HttpHeaders const &, kj::AsyncInputStream &body,
                              Response &response) override {
        return body.readAllBytes().then([this, &response](kj::Array<kj::byte> &&) {
            kj::HttpHeaders headers(*table_);
            headers.set(kj::HttpHeaderId::CONTENT_TYPE, kj::StringPtr(type_.c_str()));
            auto stream = response.send(status_, "So", headers, body_.size());
            auto promise = stream->write(body_.data(), body_.size());
            return promise.attach(kj::mv(stream));
        });
    }

private:
    kj::Own<kj::HttpHeaderTable> table_ = kj::HttpHeaderTable::Builder().build();
    unsigned status_;
    std::string body_;
    std::string type_;
};

HttpsTest::HttpsTest()
    : table_(Orka::ProviderService::headerTable()) {
    std::filesystem::create_directory(at("certs"));
    network_.onConnection = [this](kj::Own<kj::AsyncIoStream> stream) {
        serving_.add(
            tls_->wrapServer(kj::mv(stream))
                .then([this](kj::Own<kj::AsyncIoStream> &&secured) { return server_->listenHttp(kj::mv(secured)); })
                .eagerlyEvaluate([](kj::Exception &&) {}));
    };
    embedded_ =
        std::make_unique<Orka::EmbeddedProvider>(makeArray(), Orka::ProviderSurroundings{timer_, countingUuids()});
    service_ = std::make_unique<Orka::ProviderService>(*embedded_, timer_, "/orka", "first");
    counting_ = std::make_unique<Counting>(*service_, requests_);
    client_ = newClient();
}

HttpsTest::~HttpsTest() noexcept {
    client_.reset();
    serving_.clear();
    server_.reset();
}

void HttpsTest::serveWith(kj::HttpService &service, Orkasim::CertificateSpec const &certificate) {
    auto const identity = Orkasim::makeIdentity(certificate);
    pin(identity.certificate);
    kj::TlsKeypair pair{kj::TlsPrivateKey(kj::StringPtr(identity.key.c_str())),
                        kj::TlsCertificate(kj::StringPtr(identity.certificate.c_str()))};
    kj::TlsContext::Options options;
    options.useSystemTrustStore = false;
    options.defaultKeypair = pair;
    tls_ = std::make_unique<kj::TlsContext>(options);
    server_ = std::make_unique<kj::HttpServer>(timer_, *table_, service);
}

void HttpsTest::serve(Orkasim::MisbehaviourSpec spec, std::optional<Orkasim::CertificateSpec> certificate) {
    misbehaviour_ = std::make_unique<Orkasim::Misbehaviour>(*counting_, timer_, std::move(spec));
    Orkasim::CertificateSpec usual;
    usual.names = {"array.test"};
    serveWith(*misbehaviour_, certificate.value_or(usual));
}

void HttpsTest::misbehave(Orkasim::Misdeed misdeed, std::optional<int64_t> times) {
    Orkasim::MisbehaviourSpec spec;
    spec.misdeed = misdeed;
    spec.times = times;
    serve(spec);
}

void HttpsTest::serveText(unsigned status, std::string body, std::string type) {
    fixed_ = std::make_unique<FixedText>(status, std::move(body), std::move(type));
    Orkasim::CertificateSpec usual;
    usual.names = {"array.test"};
    serveWith(*fixed_, usual);
}

void HttpsTest::pin(std::string const &pem, std::string const &name) {
    writeBytes(at("certs/" + name), pem);
}

std::unique_ptr<Orka::Provider> HttpsTest::newClient(std::string const &address) {
    return Orka::makeProvider(address, {timer_, nullptr, &network_, at("certs")});
}

Orka::CallContext HttpsTest::context(std::string key, kj::Duration time) {
    return {timer_.now() + time, std::nullopt, std::move(key)};
}
