// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <kj/async-io.h>
#include <kj/compat/http.h>
#include <kj/compat/tls.h>

#include "serve/Certificate.h"

namespace Orkasim {

/// Accepts connections, agrees on TLS with each by itself, and hands requests to a service. A client that never ends
/// its handshake keeps nobody else waiting, and is dropped after ten seconds.
class Server final : private kj::TaskSet::ErrorHandler {
public:
    /// @param errors answers what never comes to the service, or fails there
    Server(kj::Own<kj::ConnectionReceiver> port, Identity const &identity, kj::HttpService &service,
           kj::HttpServerErrorHandler &errors, kj::Timer &timer);

    /// Never done; rejected when the port cannot be listened at any more. While the system has no descriptor for one
    /// more client, new ones wait.
    kj::Promise<void> run();
    /// Takes no more requests; done when those that were begun are, or after five seconds.
    kj::Promise<void> stop();

private:
    kj::Promise<void> serve(kj::Own<kj::AsyncIoStream> stream);
    /// One client's failure is nobody else's business.
    void taskFailed(kj::Exception &&) override {}

    kj::Own<kj::ConnectionReceiver> port_;
    kj::Timer &timer_;
    kj::Own<kj::HttpHeaderTable> table_;
    kj::TlsContext tls_;
    kj::HttpServer http_;
    kj::TaskSet connections_;
};

} // namespace Orkasim
