// SPDX-License-Identifier: Apache-2.0
#include <memory>

#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

using Wire::ErrorCode;

class Session : public Host {};

bool ask() {
    return LumoLib_SetFaultInjectionEnabled(true);
}

TEST_F(Session, opens_when_a_daemon_answers) {
    FakeDaemon daemon(socket(), answerDone);
    EXPECT_TRUE(LumoLib_Init(0, 0));
    EXPECT_TRUE(ask());
    EXPECT_EQ(lastFailure(), "none");
}

TEST_F(Session, fault_33_fails_at_once_without_a_daemon) {
    auto const start = std::chrono::steady_clock::now();
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at " + socket() + ": No such file or directory");
}

TEST_F(Session, fault_33_fails_at_once_on_a_socket_that_nobody_serves) {
    { Listener const gone(socket(), 1); }
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at " + socket() + ": Connection refused");
}

TEST_F(Session, fault_33_fails_at_once_on_a_root_that_does_not_exist_and_has_a_long_name) {
    set("TOVI_ROOT", paths().root() + "/" + std::string(150, 'x'));
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at " + paths().root() + "/" + std::string(150, 'x') +
                                 "/run/lumod.sock: No such file or directory");
}

TEST_F(Session, requests_without_one_fail) {
    FakeDaemon daemon(socket(), answerDone);
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::NoSession));
    EXPECT_EQ(lastFailure(), "14: no session with the daemon is open");
    EXPECT_FALSE(ask());
    EXPECT_EQ(daemon.connections(), 0);
}

TEST_F(Session, counts_nested_opens) {
    FakeDaemon daemon(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    ASSERT_TRUE(LumoLib_Init(0, 0));
    LumoLib_Exit();
    EXPECT_TRUE(ask());
    LumoLib_Exit();
    EXPECT_FALSE(ask());
    EXPECT_EQ(daemon.connections(), 1);
}

TEST_F(Session, closing_past_zero_does_nothing) {
    FakeDaemon daemon(socket(), answerDone);
    LumoLib_Exit();
    LumoLib_Exit();
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_TRUE(ask());
    LumoLib_Exit();
    EXPECT_FALSE(ask());
}

TEST_F(Session, a_failed_open_counts_for_nothing) {
    EXPECT_FALSE(LumoLib_Init(0, 0));
    FakeDaemon daemon(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    LumoLib_Exit();
    EXPECT_FALSE(ask());
}

TEST_F(Session, a_nested_open_fails_when_the_daemon_has_gone_and_the_outer_one_stays) {
    auto daemon = std::make_unique<FakeDaemon>(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    daemon.reset();
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::DaemonNotRunning));
    daemon = std::make_unique<FakeDaemon>(socket(), answerDone);
    EXPECT_TRUE(ask());
    LumoLib_Exit();
    EXPECT_FALSE(ask());
}

TEST_F(Session, offline_opens_and_every_request_fails) {
    set("TOVI_OFFLINE", "1");
    FakeDaemon daemon(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(lastFailure(), "none");
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::DaemonNotRunning));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at " + socket());
    LumoMetadata *metadata = nullptr;
    EXPECT_EQ(LumoLib_GetLumoMetadata(containerId, volumeId, &metadata), code(ErrorCode::DaemonNotRunning));
    EXPECT_EQ(metadata, nullptr);
    EXPECT_EQ(daemon.connections(), 0);
}

TEST_F(Session, going_offline_takes_an_open_session_along) {
    auto daemon = std::make_unique<FakeDaemon>(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    daemon.reset();
    EXPECT_FALSE(LumoLib_Init(0, 0));
    set("TOVI_OFFLINE", "1");
    EXPECT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::DaemonNotRunning));
}

TEST_F(Session, coming_back_online_takes_an_open_session_along) {
    set("TOVI_OFFLINE", "1");
    FakeDaemon daemon(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::DaemonNotRunning));
    set("TOVI_OFFLINE", "");
    EXPECT_TRUE(LumoLib_Init(0, 0));
    EXPECT_TRUE(ask());
    EXPECT_EQ(daemon.connections(), 1);
}

TEST_F(Session, another_root_takes_an_open_session_along) {
    FakeDaemon daemon(socket(), answerDone);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    set("TOVI_ROOT", "/nonexistent");
    EXPECT_FALSE(LumoLib_Init(0, 0));
    EXPECT_TRUE(ask()); // what is open stays when the other one cannot be had
    set("TOVI_OFFLINE", "1");
    EXPECT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), code(ErrorCode::DaemonNotRunning));
    EXPECT_EQ(lastFailure(), "10: no daemon answers at /nonexistent/run/lumod.sock");
}

TEST_F(Session, container_ids_need_none) {
    char buffer[37];
    ASSERT_TRUE(LumoLib_NormalizeContainerIdString("{0A1B2C3D4E5F60718293A4B5C6D7E8F9}", buffer));
    EXPECT_STREQ(buffer, containerId);
    EXPECT_FALSE(LumoLib_NormalizeContainerIdString("no id", buffer));
    EXPECT_STREQ(buffer, "");
    EXPECT_FALSE(LumoLib_NormalizeContainerIdString(nullptr, buffer));
    EXPECT_FALSE(LumoLib_NormalizeContainerIdString(containerId, nullptr));
    EXPECT_EQ(lastFailure(), "none");
}

TEST_F(Session, error_texts_come_from_the_one_table) {
    EXPECT_STREQ(LumoLib_Err2String(0), "success");
    EXPECT_STREQ(LumoLib_Err2String(24), "no such virtual volume");
    EXPECT_EQ(LumoLib_Err2String(12345), nullptr);
}

TEST_F(Session, error_records_tolerate_null) {
    EXPECT_FALSE(LumoLib_ErrorExIsSuccess(nullptr));
    EXPECT_STREQ(LumoLib_ErrorExStr(nullptr), "");
}

TEST_F(Session, the_command_and_the_time_left_travel_with_a_request) {
    set("TOVI_REQUEST_ID", "command-7");
    set("TOVI_TIMEOUT_MS", "4321");
    std::uint32_t deadlineMs = 0;
    {
        FakeDaemon daemon(socket(), [&](Wire::Request::Reader request, Peer &peer) {
            deadlineMs = request.getDeadlineMs();
            EXPECT_EQ(request.getVersion(), Wire::PROTOCOL_VERSION);
            EXPECT_EQ(request.getId(), 1U);
            peer.done(request.getId());
        });
        ASSERT_TRUE(LumoLib_Init(0, 0));
        ASSERT_TRUE(ask());
        EXPECT_EQ(daemon.asked().at(0), R"((traceId = "command-7", setFaultInjectionEnabled = true))");
    }
    EXPECT_LE(deadlineMs, 4321U);
    EXPECT_GT(deadlineMs, 3000U);
}

TEST_F(Session, a_senseless_timeout_counts_as_none) {
    for (std::string const value : {"0", "-5", "soon", "10s", "99999999999", ""}) {
        set("TOVI_TIMEOUT_MS", value);
        FakeDaemon daemon(socket(), [&](Wire::Request::Reader request, Peer &peer) {
            EXPECT_LE(request.getDeadlineMs(), 30000U);
            EXPECT_GT(request.getDeadlineMs(), 20000U) << value;
            peer.done(request.getId());
        });
        ASSERT_TRUE(LumoLib_Init(0, 0));
        EXPECT_TRUE(ask());
        LumoLib_Exit();
    }
}

} // namespace LumoTest
