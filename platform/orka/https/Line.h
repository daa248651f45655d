// SPDX-License-Identifier: Apache-2.0
//
// The way to one provider: finding its address, connecting, checking its certificate, keeping connections that are
// idle. Nothing here waits by itself: who asks for a connection bounds the time.
#pragma once

#include <deque>
#include <memory>
#include <string>

#include <kj/async-io.h>
#include <kj/compat/http.h>
#include <kj/refcount.h>
#include <kj/timer.h>

#include "https/Trust.h"
#include "https/Url.h"
#include "orka/Outcome.h"

namespace Orka::Https {

/// One connection: requests go over it one after the other.
struct Connection {
    kj::Own<kj::AsyncIoStream> stream;
    kj::Own<kj::HttpClient> client;
    bool isUsed = false; ///< a request went over it before
    kj::TimePoint idleSince = kj::origin<kj::TimePoint>();
};

/// What the setting up of a connection is doing; for the sentence when time runs out.
enum class Step { LookingUp, Connecting, ShakingHands, Connected };

class Line final : public kj::Refcounted {
public:
    Line(Url url, std::string const &certificates, kj::Network &network, kj::Timer &timer);

    /// An idle connection, or a new one. @param fresh an idle one will not do @param step is kept up to date
    /// Failures: ProviderUnreachable, naming the provider and what it did; those of Trust.
    kj::Promise<Outcome<kj::Own<Connection>>> connection(bool fresh, std::shared_ptr<Step> step);
    /// Takes a connection back whose last answer was read to its end.
    void keep(kj::Own<Connection> connection);

    Url const &url() const {
        return url_;
    }
    std::string const &authority() const {
        return authority_;
    }
    kj::HttpHeaderTable const &headers() const {
        return *headers_.table;
    }
    kj::HttpHeaderId contentEncoding() const {
        return headers_.contentEncoding;
    }

private:
    kj::Promise<Outcome<kj::Own<Connection>>> open(std::shared_ptr<Step> step);
    kj::Promise<Outcome<kj::Own<Connection>>> secure(kj::Own<kj::AsyncIoStream> stream, std::shared_ptr<Step> step);
    kj::Promise<kj::Own<kj::NetworkAddress>> address();
    kj::Promise<void> lookUp();
    kj::Promise<void> closeIdle();
    Wire::Failure unreachable(Step step, kj::Exception const &exception);

    Url url_;
    std::string authority_;
    Trust trust_;
    kj::Network &network_;
    kj::Timer &timer_;
    struct Headers {
        Headers();
        kj::HttpHeaderId contentEncoding;
        kj::Own<kj::HttpHeaderTable> table;
    };
    Headers headers_;
    std::deque<kj::Own<Connection>> idle_;
    /// One name lookup serves everybody who waits for it: those of a resolver that hangs must not gather threads.
    kj::ForkedPromise<void> lookup_ = nullptr;
    bool isLookingUp_ = false;
    kj::TimePoint lookupSince_ = kj::origin<kj::TimePoint>();
    kj::Own<kj::NetworkAddress> found_;
    kj::Promise<void> closing_ = nullptr;
    bool isClosing_ = false;
};

} // namespace Orka::Https
