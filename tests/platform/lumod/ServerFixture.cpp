// SPDX-License-Identifier: Apache-2.0
#include "ServerFixture.h"

#include <cerrno>
#include <cstring>

#include <sys/socket.h>

#include <capnp/serialize.h>
#include <fmt/format.h>

#include "wire/MessageBuffer.h"
#include "wire/SocketAddress.h"

namespace LumodTest {

RawClient::RawClient(std::string const &path)
    : socket_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {
    Wire::SocketAddress const address(path);
    if (::connect(socket_.get(), address.get(), address.size()) != 0) {
        throw std::runtime_error(fmt::format("{}: {}", path, std::strerror(errno)));
    }
}

std::size_t RawClient::send(std::string const &bytes) const {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        ssize_t const taken =
            ::send(socket_.get(), bytes.data() + sent, bytes.size() - sent, MSG_DONTWAIT | MSG_NOSIGNAL);
        if (taken <= 0) {
            break;
        }
        sent += static_cast<std::size_t>(taken);
    }
    return sent;
}

std::string const &RawClient::receive() {
    char buffer[65536];
    for (;;) {
        ssize_t const got = ::recv(socket_.get(), buffer, sizeof buffer, MSG_DONTWAIT);
        if (got > 0) {
            received_.append(buffer, static_cast<std::size_t>(got));
            continue;
        }
        isClosed_ = isClosed_ || got == 0 || (errno != EAGAIN && errno != EINTR);
        return received_;
    }
}

bool RawClient::isClosed() {
    receive();
    return isClosed_;
}

std::optional<std::string> RawClient::takeMessage() {
    receive();
    auto const *bytes = reinterpret_cast<std::uint8_t const *>(received_.data());
    if (received_.size() < Wire::SegmentTable::prefixBytes) {
        return std::nullopt;
    }
    std::size_t const tableBytes = Wire::SegmentTable::bytesOf(bytes);
    if (received_.size() < tableBytes) {
        return std::nullopt;
    }
    std::size_t const size = tableBytes + Wire::SegmentTable(bytes, Wire::replyBytesMax).bodyBytes();
    if (received_.size() < size) {
        return std::nullopt;
    }
    std::string message = received_.substr(0, size);
    received_.erase(0, size);
    return message;
}

std::string framedMessage(capnp::MessageBuilder &message) {
    auto const words = capnp::messageToFlatArray(message);
    auto const bytes = words.asBytes();
    return std::string(reinterpret_cast<char const *>(bytes.begin()), bytes.size());
}

std::string framed(Fill const &fill, uint64_t id, uint32_t deadlineMs) {
    capnp::MallocMessageBuilder message;
    auto request = message.initRoot<Wire::Request>();
    request.setVersion(Wire::PROTOCOL_VERSION);
    request.setId(id);
    request.setDeadlineMs(deadlineMs);
    request.setTraceId("trace-1");
    fill(request);
    return framedMessage(message);
}

WireReply parsed(std::string const &message) {
    kj::Array<capnp::word> words = kj::heapArray<capnp::word>(message.size() / sizeof(capnp::word));
    std::memcpy(words.asBytes().begin(), message.data(), message.size());
    capnp::FlatArrayMessageReader reader(words);
    auto const reply = reader.getRoot<Wire::Reply>();
    WireReply result{reply.getId(), reply.getLast(), reply.which(), Wire::ErrorCode::Success, {}};
    if (reply.isFailure()) {
        result.code = static_cast<Wire::ErrorCode>(reply.getFailure().getCode());
        result.sentence = reply.getFailure().getSentence().cStr();
    }
    return result;
}

ServerFixture::ServerFixture() {
    auto const makeProvider = [this](std::string const &url) -> std::unique_ptr<Orka::Provider> {
        return std::make_unique<FakeProvider>(vendors_.at(url));
    };
    Lumod::Settings settings;
    settings.root = root_.path();
    daemon_ = std::make_unique<Lumod::Daemon>(
        settings, Lumod::Surroundings{timer_, log_, makeProvider, [] { return std::string("key"); }});
    runDirectory_ = std::make_unique<Lumod::RunDirectory>(paths_, std::nullopt);
    server_ = std::make_unique<Lumod::Server>(*daemon_, io_, Lumod::Admission{::geteuid(), std::nullopt});
    server_->listen(runDirectory_->bindOrderedSocket(), true);
    server_->listen(runDirectory_->bindPrioritySocket(), false);
}

ServerFixture::~ServerFixture() noexcept = default;

std::shared_ptr<FakeVendor> ServerFixture::addUsualVendor() {
    auto vendor = std::make_shared<FakeVendor>();
    vendor->arrays = {arrayOf("a1", {"e1"})};
    vendor->containers = {containerOf(1, "gold", {"a1"})};
    vendors_["fake:vp"] = vendor;
    store_.putProviders({{"vp", "fake:vp", {}, {}}});
    return vendor;
}

WireReply ServerFixture::ask(RawClient &client, std::string const &request) {
    EXPECT_EQ(client.send(request), request.size());
    turn();
    auto const message = client.takeMessage();
    EXPECT_TRUE(message.has_value()) << "no answer";
    return message ? parsed(*message) : WireReply{};
}

} // namespace LumodTest
