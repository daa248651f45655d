// SPDX-License-Identifier: Apache-2.0
#include "lumod/Server.h"

#include <cerrno>
#include <cstring>
#include <utility>
#include <vector>

#include <sys/socket.h>

#include <capnp/message.h>
#include <capnp/serialize.h>
#include <fmt/format.h>
#include <kj/async-unix.h>

#include "Connection.h"
#include "Shutdown.h"
#include "wire/Failure.h"
#include "wire/lumod.capnp.h"

namespace Lumod {

namespace {

/// After this long the requests under way are told that they are given up, ...
constexpr kj::Duration drainPatience = 4 * kj::SECONDS;
/// ... and this much later nobody is waited for any more: within five seconds in all.
constexpr kj::Duration lastPatience = 500 * kj::MILLISECONDS;
/// How long to wait for descriptors or memory to become free.
constexpr kj::Duration acceptPause = 100 * kj::MILLISECONDS;
/// Connections to take before the others have their turn.
constexpr int acceptsInARow = 64;

/// The last words to whoever is not admitted. Said once: for him nobody waits.
void sayWhyNot(int client, std::string const &sentence) {
    capnp::MallocMessageBuilder message;
    auto failure = message.initRoot<Wire::Reply>().initFailure(); // with id 0: it answers no request in particular
    failure.setCode(static_cast<int32_t>(Wire::ErrorCode::NotPermitted));
    failure.setSentence(sentence.c_str());
    auto const words = capnp::messageToFlatArray(message);
    auto const bytes = words.asBytes();
    static_cast<void>(::send(client, bytes.begin(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL));
}

} // namespace

class Server::Implementation final : public kj::TaskSet::ErrorHandler {
public:
    Implementation(Daemon &daemon, kj::AsyncIoContext &io, Admission admission)
        : core_(daemon.core())
        , io_(io)
        , admission_(admission)
        , connections_(*this)
        , accepting_(std::make_unique<kj::TaskSet>(*this)) {}

    void listen(Wire::UniqueFd socket, bool ordered) {
        listeners_.push_back(std::make_unique<Listener>(io_.unixEventPort, std::move(socket), ordered));
        accepting_->add(acceptAll(*listeners_.back()));
    }

    kj::Promise<void> stop() {
        accepting_ = nullptr;
        listeners_.clear();
        shutdown_.drain();
        kj::Timer &timer = core_.timer;
        auto givenUp = timer.afterDelay(drainPatience).then([this, &timer] {
            shutdown_.giveUp();
            return timer.afterDelay(lastPatience);
        });
        return connections_.onEmpty().exclusiveJoin(kj::mv(givenUp));
    }

    std::size_t connections() const {
        return count_;
    }

private:
    struct Listener {
        Listener(kj::UnixEventPort &port, Wire::UniqueFd bound, bool isOrdered)
            : socket(std::move(bound))
            , observer(port, socket.get(), kj::UnixEventPort::FdObserver::OBSERVE_READ)
            , ordered(isOrdered) {}

        Wire::UniqueFd socket;
        kj::UnixEventPort::FdObserver observer;
        bool ordered;
    };

    /// Takes connections until the server stops: one that could not be taken, for want of memory, is not the last.
    kj::Promise<void> acceptAll(Listener &listener) {
        return kj::evalLater([this, &listener] { return accept(listener); })
            .catch_([this, &listener](kj::Exception &&exception) {
                logShortage(exception.getDescription().cStr());
                return core_.timer.afterDelay(acceptPause).then([this, &listener] { return acceptAll(listener); });
            });
    }

    kj::Promise<void> accept(Listener &listener) {
        for (int accepted = 0; accepted < acceptsInARow; ++accepted) {
            int const client = ::accept4(listener.socket.get(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
            if (client >= 0) {
                isShort_ = false;
                admit(kj::AutoCloseFd(client), listener.ordered);
            } else if (errno == EAGAIN || errno == EWOULDBLOCK) {
                return listener.observer.whenBecomesReadable().then([this, &listener] { return accept(listener); });
            } else if (errno != EINTR && errno != ECONNABORTED) {
                logShortage(std::strerror(errno));
                return core_.timer.afterDelay(acceptPause).then([this, &listener] { return accept(listener); });
            }
        }
        return kj::evalLater([this, &listener] { return accept(listener); });
    }

    void logShortage(char const *why) {
        if (!std::exchange(isShort_, true)) {
            core_.log.write(LogLevel::Error, "-", fmt::format("cannot take a connection: {}; trying again", why));
        }
    }

    void admit(kj::AutoCloseFd client, bool ordered) {
        auto const peer = peerOf(client.get());
        if (!peer || !admission_.admits(*peer)) {
            core_.log.write(LogLevel::Warning, "-",
                            peer ? fmt::format("refused a connection of user {} (group {}, process {})", peer->uid,
                                               peer->gid, peer->pid)
                                 : std::string("refused a connection of an unknown user"));
            sayWhyNot(client.get(), refusal(peer));
            return;
        }
        auto connection = kj::heap<Connection>(core_, shutdown_, replyRoom_, io_.unixEventPort, kj::mv(client), ordered,
                                               ++lastNumber_);
        ++count_;
        auto counted = kj::defer([this] { --count_; });
        auto served = kj::evalLater([connection = connection.get()] { return connection->run(); });
        connections_.add(served.attach(kj::mv(connection), kj::mv(counted)));
    }

    std::string refusal(std::optional<Peer> const &peer) const {
        return fmt::format("{} may not use this daemon; it serves root{}{}",
                           peer ? fmt::format("user {}", peer->uid) : std::string("an unknown user"),
                           admission_.ownUid != 0 ? fmt::format(", user {}", admission_.ownUid) : std::string(),
                           admission_.group ? fmt::format(" and the group {}", *admission_.group) : std::string());
    }

    void taskFailed(kj::Exception &&exception) override {
        // A peer that goes away in the middle is no event; its connection is simply over.
        bool const isPeer = exception.getType() == kj::Exception::Type::DISCONNECTED;
        core_.log.write(isPeer ? LogLevel::Verbose : LogLevel::Error, "-",
                        fmt::format("a connection ended: {}", exception.getDescription().cStr()));
    }

    Core &core_;
    kj::AsyncIoContext &io_;
    Admission admission_;
    Shutdown shutdown_;
    ReplyRoom replyRoom_;
    uint64_t lastNumber_ = 0;
    std::size_t count_ = 0;
    bool isShort_ = false;
    kj::TaskSet connections_;
    std::vector<std::unique_ptr<Listener>> listeners_;
    std::unique_ptr<kj::TaskSet> accepting_; ///< before the listeners that it waits for
};

Server::Server(Daemon &daemon, kj::AsyncIoContext &io, Admission admission)
    : implementation_(std::make_unique<Implementation>(daemon, io, admission)) {}

Server::~Server() = default;

void Server::listen(Wire::UniqueFd socket, bool ordered) {
    implementation_->listen(std::move(socket), ordered);
}

kj::Promise<void> Server::stop() {
    return implementation_->stop();
}

std::size_t Server::connections() const {
    return implementation_->connections();
}

} // namespace Lumod
