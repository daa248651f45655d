// SPDX-License-Identifier: Apache-2.0
#include "serve/Server.h"

#include "wire/Failure.h"

namespace Orkasim {

namespace {

constexpr kj::Duration handshakeTime = 10 * kj::SECONDS;
constexpr kj::Duration stopTime = 5 * kj::SECONDS;
constexpr kj::Duration acceptPause = 100 * kj::MILLISECONDS;
/// Longer than clients keep an idle connection, so that it is they who close it.
constexpr kj::Duration idleTime = 15 * kj::SECONDS;

kj::TlsContext contextFor(Identity const &identity) {
    try {
        kj::TlsKeypair pair{kj::TlsPrivateKey(kj::StringPtr(identity.key.c_str())),
                            kj::TlsCertificate(kj::StringPtr(identity.certificate.c_str()))};
        kj::TlsContext::Options options;
        options.useSystemTrustStore = false;
        options.minVersion = kj::TlsVersion::TLS_1_2;
        options.defaultKeypair = pair;
        return kj::TlsContext(options);
    } catch (kj::Exception const &) {
        throw Wire::Failure(Wire::ErrorCode::FileMalformed, "certificate and key are no pair in PEM");
    }
}

kj::HttpServerSettings settingsWith(kj::HttpServerErrorHandler &errors) {
    kj::HttpServerSettings result;
    result.pipelineTimeout = idleTime;
    result.errorHandler = errors;
    return result;
}

} // namespace

Server::Server(kj::Own<kj::ConnectionReceiver> port, Identity const &identity, kj::HttpService &service,
               kj::HttpServerErrorHandler &errors, kj::Timer &timer)
    : port_(kj::mv(port))
    , timer_(timer)
    , table_(kj::HttpHeaderTable::Builder().build())
    , tls_(contextFor(identity))
    , http_(timer, *table_, service, settingsWith(errors))
    , connections_(*this) {}

kj::Promise<void> Server::run() {
    // At once, and not by its promise, is how a port says that it cannot accept.
    return kj::evalNow([this] { return port_->accept(); })
        .then(
            [this](kj::Own<kj::AsyncIoStream> &&stream) {
                connections_.add(serve(kj::mv(stream)));
                return run();
            },
            [this](kj::Exception &&exception) -> kj::Promise<void> {
                if (exception.getType() != kj::Exception::Type::OVERLOADED) {
                    return kj::mv(exception);
                }
                // No descriptor or no memory is left. It is the clients that have them who give some back.
                return timer_.afterDelay(acceptPause).then([this] { return run(); });
            });
}

kj::Promise<void> Server::serve(kj::Own<kj::AsyncIoStream> stream) {
    return timer_.timeoutAfter(handshakeTime, tls_.wrapServer(kj::mv(stream)))
        .then([this](kj::Own<kj::AsyncIoStream> &&secured) { return http_.listenHttp(kj::mv(secured)); });
}

kj::Promise<void> Server::stop() {
    return http_.drain().exclusiveJoin(timer_.afterDelay(stopTime));
}

} // namespace Orkasim
