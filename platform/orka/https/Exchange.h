// SPDX-License-Identifier: Apache-2.0
//
// One operation's way to the provider and back: a request body goes out, an answer's body comes in. All of it happens
// before the deadline, whatever the provider does. What may be repeated is tried again when the provider was overloaded
// or the connection broke: at most four times in all, 100 ms to 400 ms apart. A provider that has used all of that up
// gets one try an operation until it answers, so that it costs nobody the pauses.
#pragma once

#include <memory>
#include <string>

#include <kj/async.h>
#include <kj/time.h>

#include "https/Line.h"

namespace Orka::Https {

/// What is asked for, and how far it has come.
struct Asked {
    std::string operation;
    std::string body;
    kj::TimePoint deadline = kj::origin<kj::TimePoint>();
    /// Whether a second request has the effect of one. One that may not be repeated goes over a new connection, since a
    /// connection that was idle may turn out to be closed after something was sent.
    bool mayBeRepeated = false;

    /// The answer was that a page is no longer known.
    bool pageWasStale = false;
    std::shared_ptr<Step> step = std::make_shared<Step>(Step::Connected);
    bool isAnswering = false; ///< the head of an answer has come
    std::string lastFailure;  ///< while it waits to be tried again
};

class Exchange final : public kj::Refcounted {
public:
    Exchange(kj::Own<Line> line, kj::Timer &timer)
        : line_(kj::mv(line))
        , timer_(timer) {}

    /// The body of the answer, JSON by what its head says. Failures: what the answer tells, ProviderUnreachable,
    /// ProviderBusy, ProtocolError, DeadlineExceeded.
    kj::Promise<Outcome<std::string>> ask(std::shared_ptr<Asked> asked);

    std::string const &authority() const {
        return line_->authority();
    }

private:
    struct Attempt {
        Outcome<std::string> outcome;
        bool isWorthRepeating = false;
        bool wasStale = false; ///< an idle connection had been closed meanwhile
    };
    kj::Promise<Outcome<std::string>> attempts(std::shared_ptr<Asked> asked, int left, bool fresh, kj::Duration pause);
    kj::Promise<Attempt> attempt(std::shared_ptr<Asked> asked, bool fresh);
    kj::Promise<Attempt> over(kj::Own<Connection> connection, std::shared_ptr<Asked> asked);
    kj::Promise<Attempt> readAnswer(kj::HttpClient::Response &&response, kj::Own<Connection> connection,
                                    std::shared_ptr<Asked> asked);
    Attempt judge(unsigned status, std::string body, Asked &asked) const;
    Wire::Failure failure(Wire::ErrorCode code, Asked const &asked, std::string const &did) const;
    Wire::Failure outOfTime(Asked const &asked) const;
    std::string pathOf(Asked const &asked) const;

    kj::Own<Line> line_;
    kj::Timer &timer_;
    bool isFailing_ = false; ///< the last operation used up its tries
};

} // namespace Orka::Https
