// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <kj/async-io.h>
#include <kj/timer.h>

#include "Property.h"

namespace Fuzz {

/// An event loop with a clock of its own, which stands still while something happens and then jumps to what happens
/// next: an input takes the same time, and does the same, whatever else the machine is busy with.
class World {
public:
    World()
        : scope_(loop_)
        , timer_(kj::origin<kj::TimePoint>()) {}
    /// A world in which there are sockets.
    explicit World(kj::EventPort &port)
        : loop_(port)
        , scope_(loop_)
        , timer_(kj::origin<kj::TimePoint>()) {}

    kj::Timer &timer() {
        return timer_;
    }

    /// Lets things happen until the promise is fulfilled or rejected.
    template <typename T>
    T finish(kj::Promise<T> promise) {
        for (unsigned jumps = 0; !promise.poll(scope_); ++jumps) {
            require(jumps < jumpsMax, "it comes to an end");
            KJ_IF_MAYBE (next, timer_.nextEvent()) {
                timer_.advanceTo(*next);
            } else {
                broken("it waits for nothing that will never happen", "");
            }
        }
        return promise.wait(scope_);
    }

    /// Does what there is to do now.
    void turn() {
        scope_.poll();
    }

private:
    static constexpr unsigned jumpsMax = 10000;

    kj::EventLoop loop_;
    kj::WaitScope scope_;
    kj::TimerImpl timer_;
};

/// A peer that says what it has to say, whatever it hears, and then no more.
class Peer {
public:
    /// @param end its end of a connection
    Peer(kj::Own<kj::AsyncIoStream> end, std::string_view says)
        : end_(kj::mv(end))
        , says_(says)
        , saying_(say())
        , hearing_(hear()) {}

    /// What it heard, once the other end has closed the connection.
    kj::Promise<std::string> heard() {
        return kj::mv(hearing_);
    }

private:
    kj::Promise<void> say() {
        return end_->write(says_.data(), says_.size())
            .then([this] { end_->shutdownWrite(); })
            .eagerlyEvaluate([](kj::Exception &&) {}); // nobody listened to the end
    }
    kj::Promise<std::string> hear() {
        return end_->readAllBytes(hearsMax)
            .then([](kj::Array<kj::byte> &&bytes) {
                return std::string(reinterpret_cast<char const *>(bytes.begin()), bytes.size());
            })
            .eagerlyEvaluate(nullptr);
    }

    static constexpr std::size_t hearsMax = std::size_t{64} << 20;

    kj::Own<kj::AsyncIoStream> end_;
    std::string says_;
    kj::Promise<void> saying_;
    kj::Promise<std::string> hearing_;
};

} // namespace Fuzz
