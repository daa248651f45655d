// SPDX-License-Identifier: Apache-2.0
//
// A daemon that goes away, stands still, or does not admit the caller.
#include <memory>

#include <sys/socket.h>

#include "FakeDaemon.h"
#include "Host.h"
#include "wire/SocketAddress.h"

namespace LumoTest {

using Wire::ErrorCode;

class LostDaemon : public Host {
protected:
    void start(FakeDaemon::Handler handler, FakeDaemon::Greeting greeting = nullptr) {
        daemon_.reset();
        daemon_ = std::make_unique<FakeDaemon>(socket(), std::move(handler), std::move(greeting));
    }

    static std::int32_t change() {
        return LumoLib_DeactivateProvider("a", "p");
    }

    static std::int32_t read() {
        LumoSpaceStats *stats = nullptr;
        std::int32_t const result = LumoLib_SpaceStatsForLumo(containerId, volumeId, &stats);
        LumoLib_FreeLumoSpaceStatsInfo(stats);
        return result;
    }

    static void answerAnything(Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
            if (request.isSpaceStatsForLumo()) {
                reply.initSpaceStats();
            } else {
                reply.setDone();
            }
        });
    }

    std::unique_ptr<FakeDaemon> daemon_;
};

TEST_F(LostDaemon, is_found_again_when_it_has_restarted_between_two_requests) {
    start(answerAnything);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), 0);
    start(answerAnything);
    EXPECT_EQ(change(), 0);
    start(answerAnything);
    EXPECT_EQ(read(), 0);
    EXPECT_EQ(lastFailure(), "none");
}

TEST_F(LostDaemon, is_an_error_when_it_does_not_come_back) {
    start(answerAnything);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    daemon_.reset();
    EXPECT_EQ(change(), code(ErrorCode::DaemonNotRunning));
    EXPECT_EQ(read(), code(ErrorCode::DaemonNotRunning));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at " + socket() + ": No such file or directory");
    start(answerAnything);
    EXPECT_EQ(read(), 0);
}

/// Takes one request a connection and leaves without an answer the given number of times.
FakeDaemon::Handler leavingFirst(int times) {
    return [left = std::make_shared<int>(times)](Wire::Request::Reader request, Peer &peer) {
        if ((*left)-- > 0) {
            peer.hangUp();
        } else {
            peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
                if (request.isSpaceStatsForLumo()) {
                    reply.initSpaceStats();
                } else {
                    reply.setDone();
                }
            });
        }
    };
}

TEST_F(LostDaemon, a_request_that_reads_is_asked_once_more) {
    start(leavingFirst(1));
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(read(), 0);
    EXPECT_EQ(daemon_->asked().size(), 2U);
}

TEST_F(LostDaemon, a_request_that_reads_is_not_asked_a_third_time) {
    start(leavingFirst(2));
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(read(), code(ErrorCode::ConnectionLost));
    EXPECT_EQ(lastFailure(), "11: the daemon at " + socket() + " closed the connection before it answered");
    EXPECT_EQ(daemon_->asked().size(), 2U);
}

TEST_F(LostDaemon, a_request_that_changes_something_is_not_asked_twice) {
    start(leavingFirst(1));
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), code(ErrorCode::ConnectionLost));
    EXPECT_EQ(daemon_->asked().size(), 1U);
    EXPECT_EQ(change(), 0);
    EXPECT_EQ(daemon_->asked().size(), 2U);
}

TEST_F(LostDaemon, fault_23_leaves_in_the_middle_of_a_reply) {
    start([](Wire::Request::Reader request, Peer &peer) {
        peer.rawReplies({request.getId()}, 5);
        peer.hangUp();
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), code(ErrorCode::ConnectionLost));
    EXPECT_EQ(read(), code(ErrorCode::ConnectionLost));
    EXPECT_EQ(lastFailure(), "11: the daemon at " + socket() + " closed the connection before it answered");
}

TEST_F(LostDaemon, fault_23_leaves_between_the_replies_of_one_answer) {
    start([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(
            request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageContainers(5); }, false);
        peer.hangUp();
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    StorageContainerResult *result = nullptr;
    EXPECT_EQ(LumoLib_GetStorageContainer(1, nullptr, &result).code, code(ErrorCode::ConnectionLost));
    EXPECT_EQ(result, nullptr);
}

TEST_F(LostDaemon, fault_31_stands_still_until_the_deadline) {
    set("TOVI_TIMEOUT_MS", "150");
    start([](Wire::Request::Reader, Peer &peer) { peer.clientLeaves(10000); });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    auto const start = std::chrono::steady_clock::now();
    EXPECT_EQ(change(), code(ErrorCode::DeadlineExceeded));
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(149));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
    EXPECT_EQ(lastFailure(),
              "12: the daemon at " + socket() + " gave no answer within 150 ms; the change may still be carried out");
}

TEST_F(LostDaemon, fault_31_is_stopped_and_never_accepts) {
    set("TOVI_TIMEOUT_MS", "100");
    Listener const stopped(socket(), 16);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(read(), code(ErrorCode::DeadlineExceeded));
    EXPECT_EQ(lastFailure(), "12: the daemon at " + socket() + " gave no answer within 100 ms");
}

TEST_F(LostDaemon, fault_31_is_stopped_and_its_queue_is_full) {
    set("TOVI_TIMEOUT_MS", "100");
    Listener const stopped(socket(), 0);
    // The kernel lets one more wait than was asked for.
    Wire::UniqueFd const filler(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    Wire::SocketAddress const address(socket());
    ASSERT_EQ(connect(filler.get(), address.get(), address.size()), 0);
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_EQ(lastFailure(), "12: the daemon at " + socket() + " accepted no connection within 100 ms");
}

TEST_F(LostDaemon, says_why_it_does_not_admit_the_caller) {
    start(answerAnything, [](Peer &peer) {
        peer.failure(0, code(ErrorCode::NotPermitted), "user 1234 is not permitted to use this daemon");
        peer.hangUp();
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), code(ErrorCode::NotPermitted));
    EXPECT_EQ(lastFailure(), "6: user 1234 is not permitted to use this daemon");
}

TEST_F(LostDaemon, says_why_it_could_not_read_the_request) {
    start([](Wire::Request::Reader, Peer &peer) {
        peer.failure(0, code(ErrorCode::InvalidRequest), "the request is malformed: no root");
        peer.hangUp();
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), code(ErrorCode::InvalidRequest));
    EXPECT_EQ(lastFailure(), "1: the request is malformed: no root");
}

TEST_F(LostDaemon, what_it_says_unasked_between_two_requests_is_no_answer) {
    start([](Wire::Request::Reader request, Peer &peer) {
        // Both at once, so that the client finds the second one before it asks again.
        peer.rawReplies({request.getId(), request.getId() + 1});
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(change(), 0);
    EXPECT_EQ(change(), 0);
    EXPECT_EQ(change(), 0);
    EXPECT_EQ(daemon_->asked().size(), 3U);
}

} // namespace LumoTest
