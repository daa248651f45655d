// SPDX-License-Identifier: Apache-2.0
//
// A daemon that says what a test tells it to: it listens on a Unix socket in a thread of its own, notes every request
// as text, and hands each one to a function of the test. It ends with the object.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "wire/Framing.h"
#include "wire/UniqueFd.h"
#include "wire/lumod.capnp.h"

namespace LumoTest {

/// One client as the fake daemon sees it.
class Peer {
public:
    explicit Peer(Wire::UniqueFd socket)
        : socket_(std::move(socket)) {}

    /// One reply message.
    void reply(std::uint64_t id, std::function<void(Wire::Reply::Builder)> const &fill, bool last = true);
    void done(std::uint64_t id);
    void failure(std::uint64_t id, std::int32_t code, std::string const &sentence);
    /// Bytes as they are, whatever they mean. A client that is gone is no concern here.
    void raw(void const *bytes, std::size_t size);
    /// Replies of "done" with these ids in one piece, whose last bytes may be missing.
    void rawReplies(std::vector<std::uint64_t> const &ids, std::size_t missingBytes = 0);
    /// No more is read or written; what was written arrives.
    void hangUp();
    /// After this the descriptor is gone.
    void close() {
        socket_.reset();
    }
    /// Waits until the client has gone, or the time is over.
    /// @return whether it has gone
    bool clientLeaves(int milliseconds);
    int socket() const {
        return socket_.get();
    }

private:
    Wire::UniqueFd socket_;
};

/// A socket that listens and is never served, as that of a stopped process. Its file stays when it closes.
class Listener {
public:
    Listener(std::string const &socketPath, int backlog);
    int get() const {
        return socket_.get();
    }

private:
    Wire::UniqueFd socket_;
};

class FakeDaemon {
public:
    using Handler = std::function<void(Wire::Request::Reader, Peer &)>;
    using Greeting = std::function<void(Peer &)>;

    /// @param greeting is called for each connection before anything is read from it
    FakeDaemon(std::string const &socketPath, Handler handler, Greeting greeting = nullptr);
    ~FakeDaemon();
    FakeDaemon(FakeDaemon const &) = delete;
    FakeDaemon &operator=(FakeDaemon const &) = delete;

    /// The requests so far, each as text without what differs from run to run (version, id, deadline).
    std::vector<std::string> asked() const;
    int connections() const;

private:
    void accept();
    void serve(Peer &peer);

    std::string const socketPath_;
    Handler const handler_;
    Greeting const greeting_;
    Listener listener_;
    mutable std::mutex mutex_;
    std::vector<std::string> asked_;
    std::vector<std::unique_ptr<Peer>> peers_;
    std::vector<std::thread> workers_;
    std::thread acceptor_;
};

/// Answers every request that changes something.
void answerDone(Wire::Request::Reader request, Peer &peer);

} // namespace LumoTest
