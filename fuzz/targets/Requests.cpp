// SPDX-License-Identifier: Apache-2.0
//
// A client of the daemon sends any bytes over its socket: messages, and what they ask. The input's first bit chooses
// the socket (ordered or priority). Each input meets the same daemon, fresh: a provider with two containers in memory.
#include <chrono>
#include <memory>
#include <string>

#include <capnp/serialize.h>
#include <fmt/format.h>

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

void serve(std::string const &root, bool isOrdered, std::string_view says) {
    Fuzz::World world;
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
    auto pipe = kj::newTwoWayPipe();
    Fuzz::Peer peer(kj::mv(pipe.ends[0]), says);
    auto connection = kj::heap<Lumod::Connection>(daemon.core(), shutdown, kj::mv(pipe.ends[1]), isOrdered, 1);
    auto running = connection->run().catch_([](kj::Exception &&exception) {
        // A peer that leaves in the middle of an answer; everything else is a defect.
        require(exception.getType() == kj::Exception::Type::DISCONNECTED, "a connection ends in order",
                exception.getDescription().cStr());
    });
    auto serving = running.attach(kj::mv(connection)).eagerlyEvaluate(nullptr);
    checkReplies(world.finish(peer.heard()));
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
