// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>

#include <sys/socket.h>

#include <capnp/any.h>
#include <gmock/gmock.h>

#include "ServerFixture.h"

namespace {

using namespace LumodTest;
using testing::HasSubstr;
using Wire::ErrorCode;

/// A table of segments as it travels.
std::string tableOf(std::vector<uint32_t> numbers) {
    std::string bytes;
    for (uint32_t const number : numbers) {
        bytes.append(reinterpret_cast<char const *>(&number), sizeof number);
    }
    return bytes;
}

class ConnectionTest : public ServerFixture {
protected:
    /// Sends bytes on a connection of their own and tells whether the server closed it.
    bool closes(std::string const &bytes) {
        RawClient client(orderedPath());
        client.send(bytes);
        turn();
        return client.isClosed();
    }
};

TEST_F(ConnectionTest, AnswersWithTheRequestsId) {
    RawClient client(orderedPath());
    WireReply const reply = ask(client, framed(ping, 4711));
    EXPECT_EQ(reply.id, 4711U);
    EXPECT_EQ(reply.which, Wire::Reply::PONG);
    EXPECT_TRUE(reply.last);
}

TEST_F(ConnectionTest, AnswersRequestsOfOneConnectionInOrder) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    RawClient client(orderedPath());
    client.send(framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }, 1) + framed(ping, 2));
    turn();
    EXPECT_FALSE(client.takeMessage().has_value()) << "the second waits for the first";
    vendor->answer();
    turn();
    EXPECT_EQ(parsed(*client.takeMessage()).id, 1U);
    EXPECT_EQ(parsed(*client.takeMessage()).id, 1U);
    EXPECT_EQ(parsed(*client.takeMessage()).id, 2U);
}

TEST_F(ConnectionTest, RequestsThatComeTogetherAreAnsweredInOrder) {
    RawClient client(orderedPath());
    std::string bytes;
    for (uint64_t id = 1; id <= 100; ++id) {
        // So that they end at every place of what is received at once.
        bytes += framed([id](auto request) { request.setTraceId(std::string(id * 7, 't').c_str()); }, id);
    }
    EXPECT_EQ(client.send(bytes), bytes.size());
    turn();
    for (uint64_t id = 1; id <= 100; ++id) {
        auto const message = client.takeMessage();
        ASSERT_TRUE(message.has_value()) << id;
        EXPECT_EQ(parsed(*message).id, id);
    }
    EXPECT_FALSE(client.takeMessage().has_value());
}

TEST_F(ConnectionTest, RequestsAreReadWhereverTheyAreCut) {
    for (std::size_t const length : {0U, 300U, 380U, 400U, 410U, 420U, 430U, 440U, 450U, 500U, 5000U, 100000U}) {
        std::string const request =
            framed([length](auto builder) { builder.setTraceId(std::string(length, 't').c_str()); }, 1);
        for (std::size_t const cut : {1U, 7U, 8U, 9U, 100U, 511U, 512U, 513U, 4000U}) {
            if (cut >= request.size()) {
                continue;
            }
            RawClient client(orderedPath());
            client.send(request.substr(0, cut));
            turn();
            EXPECT_FALSE(client.takeMessage().has_value());
            // The next one comes with the rest.
            client.send(request.substr(cut) + framed(ping, 2));
            turn();
            for (uint64_t const id : {1U, 2U}) {
                auto const message = client.takeMessage();
                ASSERT_TRUE(message.has_value()) << length << " cut at " << cut;
                EXPECT_EQ(parsed(*message).id, id) << length << " cut at " << cut;
            }
        }
    }
}

TEST_F(ConnectionTest, AShortRequestMayHaveSegments) {
    capnp::MallocMessageBuilder message(1, capnp::AllocationStrategy::FIXED_SIZE);
    auto request = message.initRoot<Wire::Request>();
    request.setVersion(Wire::PROTOCOL_VERSION);
    request.setId(8);
    request.setTraceId("a trace id in a segment of its own");
    request.setPing();
    ASSERT_GT(message.getSegmentsForOutput().size(), 1U);
    std::string const bytes = framedMessage(message);
    for (std::size_t const cut : {0U, 4U, 8U, 12U, 15U, 16U}) { // also inside its table
        RawClient client(orderedPath());
        client.send(bytes.substr(0, cut));
        turn();
        EXPECT_FALSE(client.takeMessage().has_value()) << cut;
        client.send(bytes.substr(cut) + framed(ping, 9));
        turn();
        for (uint64_t const id : {8U, 9U}) {
            auto const reply = client.takeMessage();
            ASSERT_TRUE(reply.has_value()) << cut;
            EXPECT_EQ(parsed(*reply).id, id) << cut;
        }
    }
}

TEST_F(ConnectionTest, AnswersThatArePartlyTakenAreSentOn) {
    constexpr uint64_t requests = 5000;
    RawClient client(orderedPath());
    std::string bytes;
    for (uint64_t id = 1; id <= requests; ++id) {
        bytes += framed(ping, id);
    }
    uint64_t answered = 0;
    while (answered < requests) {
        bytes.erase(0, client.send(bytes));
        turn(); // until the socket takes no more answers
        uint64_t const before = answered;
        while (auto const message = client.takeMessage()) {
            ASSERT_EQ(parsed(*message).id, ++answered);
        }
        ASSERT_GT(answered, before);
    }
    EXPECT_EQ(ask(client, framed(ping, 7)).id, 7U);
}

TEST_F(ConnectionTest, APeerThatSaysNoMoreIsAnswered) {
    RawClient client(orderedPath());
    client.send(framed(ping, 1) + framed(ping, 2));
    ASSERT_EQ(::shutdown(client.fd(), SHUT_WR), 0);
    turn();
    EXPECT_EQ(parsed(*client.takeMessage()).id, 1U);
    EXPECT_EQ(parsed(*client.takeMessage()).id, 2U);
    EXPECT_TRUE(client.isClosed());
    EXPECT_FALSE(sink_.holds("closed connection"));
}

TEST_F(ConnectionTest, fault_17_ImpossibleLengthsCloseTheConnection) {
    EXPECT_TRUE(closes(tableOf({0, 0})));
    EXPECT_TRUE(closes(tableOf({0, 0xFFFFFFFF})));
    EXPECT_TRUE(closes(tableOf({0xFFFFFFFF, 0xFFFFFFFF})));
    EXPECT_TRUE(closes(tableOf({0, (1U << 20) / 8 + 1})));
    EXPECT_FALSE(closes(tableOf({0, (1U << 20) / 8}))) << "the limit itself is waited for";
    EXPECT_TRUE(sink_.holds("closed connection"));
}

TEST_F(ConnectionTest, fault_18_ARequestThatDripsIsDroppedAtTheDeadline) {
    RawClient client(orderedPath());
    std::string const request = framed(ping);
    for (int second = 0; second < 9; ++second) {
        client.send(request.substr(static_cast<std::size_t>(second), 1));
        turn();
        advance(1 * kj::SECONDS);
        EXPECT_FALSE(client.isClosed()) << second;
    }
    client.send(request.substr(9, 1));
    advance(1 * kj::SECONDS);
    EXPECT_TRUE(client.isClosed());
}

TEST_F(ConnectionTest, AnIdleConnectionMayStay) {
    RawClient client(orderedPath());
    ask(client, framed(ping));
    advance(1 * kj::HOURS);
    EXPECT_EQ(ask(client, framed(ping, 2)).id, 2U);
}

TEST_F(ConnectionTest, fault_19_NestingPastTheLimitIsRejected) {
    RawClient client(orderedPath());
    std::string const bytes = framed([](Wire::Request::Builder builder) { builder.initFindStorageContainer(); }, 9);
    // A chain of a hundred structures of one pointer each, hung into the place of the request's parameters.
    std::vector<uint64_t> words(bytes.size() / 8);
    std::memcpy(words.data(), bytes.data(), bytes.size());
    std::size_t const dataWords = (words[1] >> 32) & 0xFFFF;
    std::size_t const parameters = 2 + dataWords + 1;
    std::size_t const end = words.size();
    auto const structPointer = [](std::size_t from, std::size_t to) {
        auto const offset = static_cast<uint32_t>(to - from - 1);
        return (uint64_t{1} << 48) | (uint64_t{offset} << 2);
    };
    words[parameters] = structPointer(parameters, end);
    for (std::size_t level = 0; level < 100; ++level) {
        words.push_back(level == 99 ? 0 : structPointer(end + level, end + level + 1));
    }
    words[0] = uint64_t{words.size() - 1} << 32;
    std::string const nested(reinterpret_cast<char const *>(words.data()), words.size() * 8);
    WireReply const reply = ask(client, nested);
    EXPECT_EQ(reply.code, ErrorCode::InvalidRequest);
    EXPECT_EQ(reply.id, 9U);
    EXPECT_EQ(ask(client, framed(ping, 10)).id, 10U) << "the framing is intact, so the connection is";
}

TEST_F(ConnectionTest, fault_20_SumsThatOverflowAreRejected) {
    EXPECT_TRUE(closes(tableOf({1, 0xFFFFFFFF, 0xFFFFFFFF, 0})));
    EXPECT_TRUE(closes(tableOf({1, 0x80000000, 0x80000000, 0})));
    EXPECT_TRUE(closes(tableOf({3, 0x20000000, 0x20000000, 0x20000000, 0x20000000, 0})));
}

TEST_F(ConnectionTest, fault_21_AnUnknownMethodIsATypedFailure) {
    RawClient client(orderedPath());
    std::string bytes = framed(ping, 3);
    // The union's tag stands where setPing and setGetStorageContainer differ.
    std::string const other = framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }, 3);
    std::size_t tag = 0;
    while (bytes[tag] == other[tag]) {
        ++tag;
    }
    bytes[tag] = '\x7f';
    WireReply const reply = ask(client, bytes);
    EXPECT_EQ(reply.code, ErrorCode::UnknownMethod);
    EXPECT_EQ(reply.id, 3U);
    EXPECT_THAT(reply.sentence, HasSubstr("127"));
    EXPECT_EQ(ask(client, framed(ping, 4)).id, 4U);
}

TEST_F(ConnectionTest, GarbageInsideAFrameIsATypedFailure) {
    RawClient client(orderedPath());
    std::string bytes = framed(ping, 3);
    std::fill(bytes.begin() + 8, bytes.end(), '\xff');
    EXPECT_EQ(ask(client, bytes).code, ErrorCode::InvalidRequest);
}

TEST_F(ConnectionTest, fault_23_APeerThatLeavesInMidReplyHurtsNobody) {
    auto const vendor = addUsualVendor();
    vendor->containers.clear();
    for (int number = 0; number < 20000; ++number) {
        vendor->containers.push_back(containerOf(number, std::string(100, 'n'), {"a1"}));
    }
    {
        RawClient leaver(orderedPath());
        leaver.send(framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }));
        turn();
        EXPECT_GT(leaver.receive().size(), 0U);
    }
    turn();
    EXPECT_EQ(server_->connections(), 0U);
    RawClient client(orderedPath());
    EXPECT_EQ(ask(client, framed(ping)).which, Wire::Reply::PONG);
}

TEST_F(ConnectionTest, fault_23_APeerThatLeavesInMidRequestHurtsNobody) {
    std::string const longTrace(5000, 't');
    for (std::string const &request :
         {framed(ping), framed([&longTrace](auto builder) { builder.setTraceId(longTrace.c_str()); })}) {
        for (std::size_t const cut : {std::size_t{3}, std::size_t{8}, request.size() - 1}) {
            RawClient leaver(orderedPath());
            leaver.send(request.substr(0, cut));
            turn();
            EXPECT_EQ(server_->connections(), 1U);
            leaver.close();
            turn();
            EXPECT_EQ(server_->connections(), 0U) << cut << " of " << request.size();
        }
    }
    RawClient client(orderedPath());
    EXPECT_EQ(ask(client, framed(ping)).which, Wire::Reply::PONG);
}

TEST_F(ConnectionTest, APeerThatDoesNotReadCostsOneMessageAndEndsAtTheDeadline) {
    auto const vendor = addUsualVendor();
    vendor->containers.clear();
    for (int number = 0; number < 20000; ++number) {
        vendor->containers.push_back(containerOf(number, std::string(100, 'n'), {"a1"}));
    }
    RawClient lazy(orderedPath());
    lazy.send(framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }));
    turn();
    EXPECT_EQ(server_->connections(), 1U);
    advance(31 * kj::SECONDS);
    EXPECT_EQ(server_->connections(), 0U);
}

TEST_F(ConnectionTest, TheRequestsDeadlineEndsIt) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    RawClient client(orderedPath());
    client.send(framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }, 5, 2000));
    turn();
    advance(1700 * kj::MILLISECONDS);
    EXPECT_FALSE(client.takeMessage().has_value());
    advance(300 * kj::MILLISECONDS);
    WireReply const reply = parsed(*client.takeMessage());
    EXPECT_EQ(reply.code, ErrorCode::DeadlineExceeded);
    EXPECT_EQ(reply.id, 5U);
    EXPECT_TRUE(sink_.holds("trace-1 getStorageContainer failed with code 12"));
}

TEST_F(ConnectionTest, fault_24_NumbersWhereATextShouldBeAreAnInvalidRequest) {
    auto const vendor = addUsualVendor();
    // The request's own text, and one of what it asks.
    for (unsigned const place : {0U, 1U}) {
        capnp::MallocMessageBuilder message;
        auto request = message.initRoot<Wire::Request>();
        request.setVersion(Wire::PROTOCOL_VERSION);
        request.setId(7);
        request.initDeleteVirtualVolume().setContainerId(containerIdOf(1).c_str());
        auto pointers = message.getRoot<capnp::AnyStruct>().getPointerSection();
        if (place == 0) {
            pointers[0].initAs<capnp::List<uint64_t>>(3);
        } else {
            pointers[1].getAs<capnp::AnyStruct>().getPointerSection()[1].initAs<capnp::List<uint64_t>>(3);
        }
        RawClient client(orderedPath());
        WireReply const reply = ask(client, framedMessage(message));
        EXPECT_EQ(reply.id, 7U) << place;
        EXPECT_EQ(reply.code, ErrorCode::InvalidRequest) << place;
        EXPECT_FALSE(client.isClosed()) << place;
        EXPECT_TRUE(vendor->calls.empty()) << place;
    }
}

TEST_F(ConnectionTest, AReaderThatLeavesIsNotWorkedForAnyMore) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    RawClient client(orderedPath());
    client.send(framed([](Wire::Request::Builder request) { request.setGetStorageContainer(); }));
    turn();
    EXPECT_EQ(server_->connections(), 1U);
    client.close();
    turn();
    EXPECT_EQ(server_->connections(), 0U);
}

TEST_F(ConnectionTest, AChangeGoesOnWhenItsClientLeaves) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("createVirtualVolume");
    RawClient client(orderedPath());
    client.send(framed([](Wire::Request::Builder request) {
        auto create = request.initCreateVirtualVolume();
        create.setContainerId(containerIdOf(1).c_str());
        create.setDirectoryName("vm");
    }));
    turn();
    client.close();
    turn();
    vendor->answer();
    turn();
    EXPECT_EQ(vendor->volumes.size(), 1U);
    EXPECT_EQ(server_->connections(), 0U);
}

TEST_F(ConnectionTest, ThePrioritySocketGoesPastTheOrderedQueue) {
    auto const vendor = addUsualVendor();
    std::string const uuid = vendor->addVolume(containerIdOf(1), "vm");
    vendor->hanging.insert("createVirtualVolume");
    RawClient stuck(orderedPath());
    stuck.send(framed([](Wire::Request::Builder request) {
        auto create = request.initCreateVirtualVolume();
        create.setContainerId(containerIdOf(1).c_str());
        create.setDirectoryName("other");
    }));
    turn();
    auto const bind = framed([&uuid](Wire::Request::Builder request) {
        auto key = request.initBindVirtualVolume();
        key.setContainerId(containerIdOf(1).c_str());
        key.setUuid(uuid.c_str());
    });
    RawClient ordered(orderedPath());
    ordered.send(bind);
    turn();
    EXPECT_FALSE(ordered.takeMessage().has_value());
    RawClient priority(paths_.prioritySocket());
    EXPECT_EQ(ask(priority, bind).which, Wire::Reply::VOLUME);
}

} // namespace
