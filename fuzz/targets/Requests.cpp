// SPDX-License-Identifier: Apache-2.0
//
// A client of the daemon sends any bytes over its socket: messages, and what they ask. The input's first bit chooses
// the socket (ordered or priority). Each input meets the same daemon, fresh: a provider with two containers in memory.
#include <cerrno>
#include <chrono>
#include <memory>
#include <string>
#include <utility>

#include <capnp/serialize.h>
#include <fmt/format.h>
#include <kj/async-unix.h>
#include <sys/socket.h>

#include "Connection.h"
#include "FakeVendor.h"
#include "Property.h"
#include "Scratch.h"
#include "World.h"
#include "lumod/Daemon.h"
#include "plexa/Text.h"
#include "store/HostStore.h"

namespace {

using Fuzz::require;

/// A host with one provider. The seeds name what is there.
struct Host {
    Host() {
        Store::HostStore store(directory.path(), Store::HostStore::Mode::ReadWrite);
        store.putProviders({{"provider", "fake:provider", {}, {}}});
    }
    Fuzz::ScratchDirectory directory;
};

std::shared_ptr<LumodTest::FakeVendor> someVendor() {
    auto vendor = std::make_shared<LumodTest::FakeVendor>();
    Orka::Endpoint endpoint;
    endpoint.uid = "endpoint";
    endpoint.text1 = "lun";
    endpoint.isAccessible = endpoint.isConfigured = true;
    vendor->arrays = {{"array", "name", "vendor", "model", {endpoint}}};
    vendor->containers = {{"0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9", "gold", 4096, {"array"}},
                          {"1a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9", "silver", 1, {"array"}}};
    vendor->addVolume(vendor->containers[0].id, "directory"); // 00000000-0000-4000-8000-000000000001
    vendor->addVolume(vendor->containers[0].id, "", Orka::VolumeKind::Data);
    return vendor;
}

class NoLog : public Lumod::LogSink {
public:
    void write(std::string_view line) override {
        require(Plexa::isValidUtf8(line), "a line of the log is UTF-8", line);
        require(!line.empty() && line.find('\n') == line.size() - 1, "a line of the log is one line", line);
    }
};

void checkFailure(Wire::FailureReply::Reader failure) {
    require(failure.getCode() != 0 && Wire::textOf(failure.getCode()) != nullptr, "a failure's code is in the table");
    std::string_view const sentence(failure.getSentence().begin(), failure.getSentence().size());
    require(!sentence.empty() && sentence.find('\n') == std::string_view::npos, "a sentence is one line", sentence);
}

/// What comes back is whole messages, each of which a client can read.
void checkReplies(std::string_view heard) {
    while (!heard.empty()) {
        auto const *const table = reinterpret_cast<std::uint8_t const *>(heard.data());
        require(heard.size() >= Wire::SegmentTable::prefixBytes, "a reply is whole");
        std::size_t const tableBytes = Wire::SegmentTable::bytesOf(table);
        require(heard.size() >= tableBytes, "a reply's table is whole");
        Wire::MessageBuffer buffer;
        auto place = buffer.prepare(Wire::SegmentTable(table, Wire::replyBytesMax));
        require(heard.size() - tableBytes >= place.size(), "a reply's body is whole");
        std::copy_n(table + tableBytes, place.size(), place.begin());
        heard.remove_prefix(tableBytes + place.size());
        capnp::SegmentArrayMessageReader reader(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
        auto const reply = reader.getRoot<Wire::Reply>();
        reply.totalSize();
        if (reply.isFailure()) {
            checkFailure(reply.getFailure());
        }
    }
}

std::pair<kj::AutoCloseFd, kj::AutoCloseFd> socketPair() {
    int ends[2];
    require(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0, ends) == 0, "there are sockets");
    return {kj::AutoCloseFd(ends[0]), kj::AutoCloseFd(ends[1])};
}

/// Says what it has to say, whatever it hears, and then no more.
class Client {
public:
    Client(kj::UnixEventPort &port, kj::AutoCloseFd end, std::string_view says)
        : end_(kj::mv(end))
        , observer_(port, end_.get(), kj::UnixEventPort::FdObserver::OBSERVE_READ_WRITE)
        , says_(says)
        , saying_(say().eagerlyEvaluate([](kj::Exception &&) {})) {} // nobody listened to the end

    /// What it heard, once the other end has closed the connection.
    kj::Promise<std::string> heard() {
        char buffer[4096];
        for (;;) {
            ssize_t const got = ::recv(end_.get(), buffer, sizeof buffer, 0);
            if (got < 0 && errno == EAGAIN) {
                return observer_.whenBecomesReadable().then([this] { return heard(); });
            }
            if (got <= 0) {
                return std::move(heard_);
            }
            heard_.append(buffer, static_cast<std::size_t>(got));
        }
    }

private:
    kj::Promise<void> say() {
        while (!says_.empty()) {
            ssize_t const sent = ::send(end_.get(), says_.data(), says_.size(), MSG_NOSIGNAL);
            if (sent < 0 && errno == EAGAIN) {
                return observer_.whenBecomesWritable().then([this] { return say(); });
            }
            if (sent < 0) {
                return kj::READY_NOW;
            }
            says_.remove_prefix(static_cast<std::size_t>(sent));
        }
        ::shutdown(end_.get(), SHUT_WR);
        return kj::READY_NOW;
    }

    kj::AutoCloseFd end_;
    kj::UnixEventPort::FdObserver observer_;
    std::string_view says_;
    std::string heard_;
    kj::Promise<void> saying_;
};

void serve(std::string const &root, bool isOrdered, std::string_view says) {
    static kj::UnixEventPort port;
    Fuzz::World world(port);
    auto const vendor = someVendor();
    NoLog sink;
    Lumod::Log log(sink, Lumod::LogLevel::Trivia, [] { return std::chrono::system_clock::time_point(); });
    unsigned keys = 0;
    Lumod::Settings settings;
    settings.root = root;
    Lumod::Daemon daemon(settings, Lumod::Surroundings{world.timer(), log,
                                                       [&](std::string const &) {
                                                           return std::make_unique<LumodTest::FakeProvider>(vendor);
                                                       },
                                                       [&] { return fmt::format("key-{}", ++keys); }});
    Lumod::Shutdown shutdown;
    Lumod::ReplyRoom room;
    auto ends = socketPair();
    Client client(port, kj::mv(ends.first), says);
    auto connection =
        kj::heap<Lumod::Connection>(daemon.core(), shutdown, room, port, kj::mv(ends.second), isOrdered, 1);
    auto running = connection->run().catch_([](kj::Exception &&exception) {
        // A peer that leaves in the middle of an answer; everything else is a defect.
        require(exception.getType() == kj::Exception::Type::DISCONNECTED, "a connection ends in order",
                exception.getDescription().cStr());
    });
    auto serving = running.attach(kj::mv(connection)).eagerlyEvaluate(nullptr);
    checkReplies(world.finish(client.heard()));
    world.finish(kj::mv(serving));
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    static Host const host;
    if (size > 0) {
        serve(host.directory.path(), (data[0] & 1) == 0, Fuzz::textOf(data + 1, size - 1));
    }
    return 0;
}
