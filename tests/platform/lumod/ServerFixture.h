// SPDX-License-Identifier: Apache-2.0
//
// A real server on Unix sockets in a fresh root, and clients that send raw bytes. Server and clients share one thread:
// a client's bytes wait in the kernel until the test lets the server's event loop turn. The daemon's clock is the
// test's; no test waits for time to pass.
#pragma once

#include <kj/async-io.h>
#include <kj/async-unix.h>

#include "Fixture.h"
#include "lumod/RunDirectory.h"
#include "lumod/Server.h"

namespace LumodTest {

/// A client end that never blocks.
class RawClient {
public:
    explicit RawClient(std::string const &path);

    int fd() const {
        return socket_.get();
    }
    /// Sends what the kernel takes; returns how much that was.
    std::size_t send(std::string const &bytes) const;
    /// Everything that has come.
    std::string const &receive();
    bool isClosed();
    void close() {
        socket_.reset();
    }

    /// One whole message that has come, taken off; nothing while it is incomplete.
    std::optional<std::string> takeMessage();

private:
    Wire::UniqueFd socket_;
    std::string received_;
    bool isClosed_ = false;
};

/// A request in the wire's framing.
std::string framed(Fill const &fill, uint64_t id = 1, uint32_t deadlineMs = 30000);
std::string framedMessage(capnp::MessageBuilder &message);

/// A reply that came over the wire.
struct WireReply {
    uint64_t id = 0;
    bool last = true;
    Wire::Reply::Which which = Wire::Reply::DONE;
    Wire::ErrorCode code = Wire::ErrorCode::Success;
    std::string sentence;
};
WireReply parsed(std::string const &message);

class ServerFixture : public testing::Test {
protected:
    ServerFixture();
    ~ServerFixture() noexcept override;

    /// Lets the server do all that it can do now.
    void turn() {
        io_.waitScope.poll();
    }
    void advance(kj::Duration duration) {
        timer_.advanceTo(timer_.now() + duration);
        turn();
    }
    std::shared_ptr<FakeVendor> addUsualVendor();
    std::string orderedPath() const {
        return paths_.orderedSocket();
    }
    /// Sends a request and takes its only reply.
    WireReply ask(RawClient &client, std::string const &request);
    static void ping(Wire::Request::Builder request) {
        request.setPing();
    }

    TempDirectory root_;
    Wire::Paths paths_{root_.path()};
    kj::AsyncIoContext io_ = kj::setupAsyncIo();
    kj::TimerImpl timer_{kj::origin<kj::TimePoint>()};
    MemorySink sink_;
    std::chrono::system_clock::time_point wallClock_{};
    Lumod::Log log_{sink_, Lumod::LogLevel::Verbose, [this] { return wallClock_; }};
    std::map<std::string, std::shared_ptr<FakeVendor>> vendors_;
    Store::HostStore store_{root_.path(), Store::HostStore::Mode::ReadWrite};
    std::unique_ptr<Lumod::Daemon> daemon_;
    std::unique_ptr<Lumod::RunDirectory> runDirectory_;
    std::unique_ptr<Lumod::Server> server_;
};

} // namespace LumodTest
