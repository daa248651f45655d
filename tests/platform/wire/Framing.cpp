// SPDX-License-Identifier: Apache-2.0
#include "wire/Framing.h"

#include <algorithm>
#include <csignal>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <sys/socket.h>
#include <unistd.h>

#include <capnp/message.h>
#include <capnp/serialize.h>

#include "wire/Failure.h"
#include "wire/Stream.h"
#include "wire/UniqueFd.h"
#include "wire/lumod.capnp.h"

#include <gtest/gtest.h>

namespace {

using Wire::ErrorCode;

Wire::Deadline in(int milliseconds) {
    return std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
}

/// More than any test takes, so that a broken one ends.
constexpr int patience = 10000;

class Framing : public testing::Test {
protected:
    void SetUp() override {
        int both[2];
        ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, both), 0);
        here_.reset(both[0]);
        there_.reset(both[1]);
    }

    void sendRaw(void const *bytes, std::size_t size) {
        ASSERT_EQ(send(there_.get(), bytes, size, MSG_NOSIGNAL), static_cast<ssize_t>(size));
    }

    void sendTable(std::vector<std::uint32_t> const &numbers) {
        sendRaw(numbers.data(), 4 * numbers.size());
    }

    Wire::UniqueFd here_;
    Wire::UniqueFd there_;
    Wire::MessageBuffer buffer_;
};

ErrorCode codeOf(std::function<void()> const &work) {
    try {
        work();
        return ErrorCode::Success;
    } catch (Wire::Failure const &failure) {
        return failure.code();
    }
}

std::string sentenceOf(std::function<void()> const &work) {
    try {
        work();
        return "no failure";
    } catch (Wire::Failure const &failure) {
        return failure.sentence();
    }
}

void fillPing(capnp::MessageBuilder &message, std::string const &traceId) {
    Wire::Request::Builder request = message.initRoot<Wire::Request>();
    request.setId(7);
    request.setTraceId(traceId.c_str());
    request.setPing();
}

TEST_F(Framing, carries_a_message) {
    capnp::MallocMessageBuilder message;
    fillPing(message, "trace");
    std::size_t sentBytes = 0;
    Wire::send(there_.get(), message, Wire::requestBytesMax, in(patience), &sentBytes);
    EXPECT_EQ(sentBytes, 8 + 8 * message.getSegmentsForOutput()[0].size());
    ASSERT_TRUE(Wire::receive(here_.get(), buffer_, Wire::requestBytesMax, in(patience)));
    capnp::SegmentArrayMessageReader reader(buffer_.segments(), Wire::readerOptions(buffer_.bodyBytes()));
    EXPECT_EQ(reader.getRoot<Wire::Request>().getId(), 7U);
    EXPECT_STREQ(reader.getRoot<Wire::Request>().getTraceId().cStr(), "trace");
}

TEST_F(Framing, carries_a_message_of_many_segments_that_no_socket_buffer_holds) {
    std::string const text(900000, 'x');
    capnp::MallocMessageBuilder message(0, capnp::AllocationStrategy::FIXED_SIZE);
    fillPing(message, text);
    ASSERT_GT(message.getSegmentsForOutput().size(), 1U);
    std::thread sender([&] { Wire::send(there_.get(), message, Wire::requestBytesMax, in(patience)); });
    bool const received = Wire::receive(here_.get(), buffer_, Wire::requestBytesMax, in(patience));
    sender.join();
    ASSERT_TRUE(received);
    capnp::SegmentArrayMessageReader reader(buffer_.segments(), Wire::readerOptions(buffer_.bodyBytes()));
    EXPECT_EQ(std::string(reader.getRoot<Wire::Request>().getTraceId().cStr()), text);
}

TEST_F(Framing, speaks_the_stream_framing_of_the_message_library) {
    capnp::MallocMessageBuilder message;
    fillPing(message, "trace");
    kj::Array<capnp::word> const flat = capnp::messageToFlatArray(message);
    sendRaw(flat.begin(), flat.asBytes().size());
    ASSERT_TRUE(Wire::receive(here_.get(), buffer_, Wire::requestBytesMax, in(patience)));

    Wire::send(here_.get(), message, Wire::requestBytesMax, in(patience));
    std::vector<kj::byte> bytes(flat.asBytes().size());
    ASSERT_EQ(recv(there_.get(), bytes.data(), bytes.size(), MSG_WAITALL), static_cast<ssize_t>(bytes.size()));
    EXPECT_TRUE(std::equal(bytes.begin(), bytes.end(), flat.asBytes().begin()));
}

TEST_F(Framing, tells_the_end_of_the_stream_between_messages) {
    there_.reset();
    EXPECT_FALSE(Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(patience)));
}

TEST_F(Framing, refuses_to_send_more_than_the_limit_and_sends_nothing_of_it) {
    capnp::MallocMessageBuilder message;
    fillPing(message, std::string(Wire::requestBytesMax, 'x'));
    std::size_t sentBytes = 0;
    EXPECT_EQ(codeOf([&] { Wire::send(there_.get(), message, Wire::requestBytesMax, in(patience), &sentBytes); }),
              ErrorCode::MessageTooLarge);
    EXPECT_EQ(sentBytes, 0U);
    there_.reset();
    EXPECT_FALSE(Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(patience)));
}

TEST_F(Framing, fault_17_refuses_a_length_without_allocating) {
    struct Case {
        std::vector<std::uint32_t> table;
        ErrorCode code;
    };
    for (Case const &hostile : {
             Case{{0, 0}, ErrorCode::ProtocolError},
             Case{{0, 0xFFFFFFFF}, ErrorCode::MessageTooLarge},
             Case{{0, Wire::replyBytesMax / 8 + 1}, ErrorCode::MessageTooLarge},
             Case{{0xFFFFFFFF, 0xFFFFFFFF}, ErrorCode::ProtocolError},
         }) {
        SetUp();
        sendTable(hostile.table);
        EXPECT_EQ(codeOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(patience)); }), hostile.code)
            << hostile.table[0] << " " << hostile.table[1];
        EXPECT_EQ(buffer_.capacityBytes(), 0U);
    }
}

TEST_F(Framing, fault_18_drops_a_peer_that_drips_bytes_at_the_deadline) {
    capnp::MallocMessageBuilder message;
    fillPing(message, std::string(100000, 'x'));
    kj::Array<capnp::word> const flat = capnp::messageToFlatArray(message);
    std::thread drip([&] {
        for (kj::byte const byte : flat.asBytes()) {
            // Each byte comes in time for itself; the peer ends the waiting when it hangs up.
            pollfd hungUp{there_.get(), POLLRDHUP, 0};
            if (send(there_.get(), &byte, 1, MSG_NOSIGNAL) != 1 || poll(&hungUp, 1, 10) != 0) {
                break;
            }
        }
    });
    auto const start = std::chrono::steady_clock::now();
    EXPECT_EQ(codeOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(150)); }),
              ErrorCode::DeadlineExceeded);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(150));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(patience));
    here_.reset();
    drip.join();
}

TEST_F(Framing, fault_18_gives_up_on_a_peer_that_does_not_read) {
    capnp::MallocMessageBuilder message;
    fillPing(message, std::string(1000000, 'x'));
    std::size_t sentBytes = 0;
    EXPECT_EQ(codeOf([&] { Wire::send(here_.get(), message, Wire::requestBytesMax, in(50), &sentBytes); }),
              ErrorCode::DeadlineExceeded);
    EXPECT_GT(sentBytes, 0U);
}

TEST_F(Framing, does_nothing_after_the_deadline) {
    capnp::MallocMessageBuilder message;
    fillPing(message, "late");
    EXPECT_EQ(codeOf([&] { Wire::send(there_.get(), message, Wire::requestBytesMax, in(-1)); }),
              ErrorCode::DeadlineExceeded);
    Wire::send(there_.get(), message, Wire::requestBytesMax, in(patience));
    EXPECT_EQ(codeOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(-1)); }),
              ErrorCode::DeadlineExceeded);
}

TEST_F(Framing, fault_22_closes_descriptors_that_come_with_a_message) {
    int pipeEnds[2];
    ASSERT_EQ(pipe2(pipeEnds, O_CLOEXEC | O_NONBLOCK), 0);
    Wire::UniqueFd const readEnd(pipeEnds[0]);
    Wire::UniqueFd writeEnd(pipeEnds[1]);

    capnp::MallocMessageBuilder message;
    fillPing(message, "with a descriptor");
    kj::Array<capnp::word> flat = capnp::messageToFlatArray(message);
    iovec piece{flat.begin(), flat.asBytes().size()};
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))] = {};
    msghdr header{};
    header.msg_iov = &piece;
    header.msg_iovlen = 1;
    header.msg_control = control;
    header.msg_controllen = sizeof control;
    cmsghdr *rights = CMSG_FIRSTHDR(&header);
    rights->cmsg_level = SOL_SOCKET;
    rights->cmsg_type = SCM_RIGHTS;
    rights->cmsg_len = CMSG_LEN(sizeof(int));
    int const passed = writeEnd.get();
    std::memcpy(CMSG_DATA(rights), &passed, sizeof passed);
    ASSERT_GT(sendmsg(there_.get(), &header, 0), 0);
    writeEnd.reset();

    char byte = 0;
    ASSERT_EQ(read(readEnd.get(), &byte, 1), -1) << "the descriptor was not on its way";
    ASSERT_TRUE(Wire::receive(here_.get(), buffer_, Wire::requestBytesMax, in(patience)));
    EXPECT_EQ(read(readEnd.get(), &byte, 1), 0) << "somebody still holds the descriptor";
}

TEST_F(Framing, fault_23_sending_to_a_peer_that_left_is_a_failure_and_no_signal) {
    there_.reset();
    capnp::MallocMessageBuilder message;
    fillPing(message, "nobody");
    std::size_t sentBytes = 0;
    EXPECT_EQ(codeOf([&] { Wire::send(here_.get(), message, Wire::requestBytesMax, in(patience), &sentBytes); }),
              ErrorCode::ConnectionLost);
    EXPECT_EQ(sentBytes, 0U);
}

TEST_F(Framing, fault_23_a_peer_that_leaves_in_mid_message_is_a_failure) {
    capnp::MallocMessageBuilder message;
    fillPing(message, std::string(100, 'x'));
    kj::Array<capnp::word> const flat = capnp::messageToFlatArray(message);
    for (std::size_t const cut : {std::size_t{1}, std::size_t{8}, flat.asBytes().size() - 1}) {
        SetUp();
        sendRaw(flat.begin(), cut);
        there_.reset();
        EXPECT_EQ(codeOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(patience)); }),
                  ErrorCode::ConnectionLost)
            << cut;
    }
}

TEST_F(Framing, fault_23_a_peer_that_leaves_without_reading_is_a_failure) {
    capnp::MallocMessageBuilder message;
    fillPing(message, "unread");
    Wire::send(here_.get(), message, Wire::requestBytesMax, in(patience));
    there_.reset(); // resets the connection, as what was sent is lost
    EXPECT_EQ(sentenceOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(patience)); }),
              "the peer closed the connection");
}

TEST_F(Framing, fault_18_holds_the_deadline_on_a_descriptor_that_does_not_block) {
    ASSERT_EQ(fcntl(here_.get(), F_SETFL, O_NONBLOCK), 0);
    sendTable({0});
    EXPECT_EQ(sentenceOf([&] { Wire::receive(here_.get(), buffer_, Wire::replyBytesMax, in(50)); }),
              "the peer was too slow");
}

TEST_F(Framing, tells_what_the_system_said_of_something_that_is_no_socket) {
    Wire::UniqueFd const file(open("/dev/null", O_RDWR | O_CLOEXEC));
    std::uint64_t const word = 0;
    std::span<std::uint64_t const> const segment(&word, 1);
    EXPECT_EQ(sentenceOf([&] {
                  Wire::sendSegments(file.get(), {&segment, 1}, 8, in(patience));
              }),
              "sending failed: Socket operation on non-socket");
    EXPECT_EQ(sentenceOf([&] { Wire::receiveTable(file.get(), 8, in(patience)); }),
              "receiving failed: Socket operation on non-socket");
}

TEST_F(Framing, sends_no_message_that_the_other_end_would_refuse) {
    std::vector<std::uint64_t> const words(3);
    std::vector<std::span<std::uint64_t const>> const segments(Wire::segmentCountMax + 1, {words.data(), 1});
    EXPECT_EQ(sentenceOf([&] { Wire::sendSegments(there_.get(), segments, 1000, in(patience)); }),
              "a message of 65 segments has more than the allowed 64");
    std::span<std::uint64_t const> const all(words);
    EXPECT_EQ(sentenceOf([&] {
                  Wire::sendSegments(there_.get(), {&all, 1}, 16, in(patience));
              }),
              "a message of 24 bytes is larger than the allowed 16");
    there_.reset();
    EXPECT_FALSE(Wire::receiveTable(here_.get(), 1000, in(patience)).has_value()) << "nothing was sent";
}

TEST_F(Framing, goes_on_after_an_interrupting_signal) {
    struct sigaction quiet {};
    quiet.sa_handler = [](int) {};
    struct sigaction old {};
    ASSERT_EQ(sigaction(SIGUSR1, &quiet, &old), 0);
    capnp::MallocMessageBuilder message;
    fillPing(message, "after a signal");
    pthread_t const waiting = pthread_self();
    std::thread sender([&] {
        pthread_kill(waiting, SIGUSR1);
        Wire::send(there_.get(), message, Wire::requestBytesMax, in(patience));
    });
    EXPECT_TRUE(Wire::receive(here_.get(), buffer_, Wire::requestBytesMax, in(patience)));
    sender.join();
    sigaction(SIGUSR1, &old, nullptr);
}

} // namespace
