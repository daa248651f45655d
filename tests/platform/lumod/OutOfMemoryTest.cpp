// SPDX-License-Identifier: Apache-2.0
//
// A request from its connection to its answer, with each allocation of the daemon's failing in turn.
#include <gmock/gmock.h>

#include "../FailingAllocator.h"
#include "ServerFixture.h"

namespace {

using namespace LumodTest;

class OutOfMemoryTest : public ServerFixture {
protected:
    /// Tries until no allocation is left to fail. What a client saw is one of: an answer, a failure, a closed
    /// connection; and whoever comes next is served.
    void sweep(Fill const &fill) {
        addUsualVendor();
        std::string const request = framed(fill);
        int failures = 0;
        bool isPending = false;
        for (long n = 1; !isPending; ++n) {
            ASSERT_LT(n, 20000) << "it never succeeds";
            RawClient client(orderedPath());
            client.send(request);
            FailingAllocator::failIn(n);
            turn();
            isPending = FailingAllocator::isPending();
            FailingAllocator::failIn(0);
            advance(1 * kj::SECONDS); // those who wait a little for memory
            auto const message = client.takeMessage();
            if (!message) {
                EXPECT_TRUE(client.isClosed()) << "no answer at allocation " << n;
                ++failures;
            } else if (auto const reply = parsed(*message); reply.which == Wire::Reply::FAILURE) {
                EXPECT_NE(reply.sentence, "") << n;
                ++failures;
            }
            ASSERT_TRUE(!isPending || (message && parsed(*message).which != Wire::Reply::FAILURE)) << "not with memory";
            client.close();
            turn();
            ASSERT_EQ(server_->connections(), 0U) << n;
            RawClient next(orderedPath());
            next.send(framed(ping));
            turn();
            auto const answer = next.takeMessage();
            ASSERT_TRUE(answer) << "nobody is served after allocation " << n << "\n" << sink_.text;
            ASSERT_NE(parsed(*answer).which, Wire::Reply::FAILURE) << n;
            next.close();
            turn();
        }
        EXPECT_GT(failures, 10);
    }
};

TEST_F(OutOfMemoryTest, fault_62_APing) {
    sweep(ping);
}

TEST_F(OutOfMemoryTest, fault_62_AListOfContainers) {
    sweep([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
}

TEST_F(OutOfMemoryTest, fault_62_WhetherVolumesAreAccessible) {
    sweep([](Wire::Request::Builder request) {
        auto check = request.initCheckLumoAccessibility();
        check.setContainerId(containerIdOf(1).c_str());
        check.initLumoIds(2).set(0, "9f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001");
    });
}

} // namespace
