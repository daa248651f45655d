// SPDX-License-Identifier: Apache-2.0
#include "lumolib/Trace.h"

#include <string>
#include <vector>

#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

struct Told {
    std::string method;
    std::string requestId;
    std::string socketPath;
    std::uint64_t sentBytes;
    std::uint64_t receivedBytes;
    std::uint32_t replies;
    std::int32_t code;
};

class Trace : public Host {
protected:
    Trace() {
        set("TOVI_REQUEST_ID", "command-9");
        LumoPlatform_TraceRequests(note, &told);
    }
    ~Trace() override {
        LumoPlatform_TraceRequests(nullptr, nullptr);
    }

    std::vector<Told> told;

private:
    static void note(void *context, LumoRequestTrace const *request) {
        static_cast<std::vector<Told> *>(context)->push_back({request->method, request->requestId, request->socketPath,
                                                              request->sentBytes, request->receivedBytes,
                                                              request->replies, request->code});
    }
};

TEST_F(Trace, tells_a_request_and_its_whole_answer) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        peer.reply(
            request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageArrays(0); }, false);
        peer.done(request.getId());
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    StorageContainerResult *containers = nullptr;
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &containers);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error));
    LumoLib_FreeStorageContainerResult(containers);
    LumoLib_Exit();
    ASSERT_EQ(told.size(), 1U);
    EXPECT_EQ(told[0].method, "getStorageContainer");
    EXPECT_EQ(told[0].requestId, "command-9");
    EXPECT_EQ(told[0].socketPath, socket());
    EXPECT_GT(told[0].sentBytes, 0U);
    EXPECT_GT(told[0].receivedBytes, 0U);
    EXPECT_EQ(told[0].replies, 2U);
    EXPECT_EQ(told[0].code, 0);
}

TEST_F(Trace, tells_failures_with_their_code) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        if (request.isDebugCommand()) {
            peer.rawReplies({request.getId() + 1});
        } else {
            peer.failure(request.getId(), 21, "no provider vp is registered");
        }
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "vp"), 21);
    EXPECT_NE(LumoLib_DebugCommand(nullptr, nullptr, nullptr), 0);
    LumoLib_Exit();
    ASSERT_EQ(told.size(), 2U);
    EXPECT_EQ(told[0].method, "deactivateProvider");
    EXPECT_EQ(told[0].code, 21);
    EXPECT_EQ(told[1].method, "debugCommand");
    EXPECT_EQ(told[1].code, 5);
}

TEST_F(Trace, is_silent_once_it_is_ended) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) { peer.done(request.getId()); });
    LumoPlatform_TraceRequests(nullptr, nullptr);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(true));
    LumoLib_Exit();
    EXPECT_TRUE(told.empty());
}

} // namespace LumoTest
