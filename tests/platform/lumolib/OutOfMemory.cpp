// SPDX-License-Identifier: Apache-2.0
//
// A request with every allocation of it failing in turn. The other thread's, the daemon's, never fail.
#include <filesystem>
#include <iterator>

#include "../FailingAllocator.h"
#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

using Wire::ErrorCode;

class OutOfMemory : public Host {};

void answerRichly(Wire::Request::Reader request, Peer &peer) {
    peer.reply(
        request.getId(),
        [](Wire::Reply::Builder reply) {
            Wire::StorageArray::Builder array = reply.initStorageArrays(1)[0];
            array.setId("a");
            array.initEndpoints(2)[0].initAddresses(3);
        },
        false);
    peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
        capnp::List<Wire::StorageContainer>::Builder containers = reply.initStorageContainers(500);
        for (Wire::StorageContainer::Builder container : containers) {
            container.setName("a name that takes some room");
            container.initArrays(1);
        }
    });
}

TEST_F(OutOfMemory, fault_62_any_allocation_may_fail) {
    FakeDaemon daemon(socket(), answerRichly);
    int failures = 0;
    for (long n = 1;; ++n) {
        StorageContainerResult *result = nullptr;
        FailingAllocator::failIn(n);
        bool const opened = LumoLib_Init(0, 0);
        LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &result);
        bool const untouched = FailingAllocator::isPending();
        FailingAllocator::failIn(0);
        if (!opened) {
            EXPECT_EQ(error.code, code(ErrorCode::NoSession)) << n;
        } else if (!LumoLib_ErrorExIsSuccess(&error)) {
            EXPECT_EQ(error.code, code(ErrorCode::OutOfMemory)) << n;
            EXPECT_EQ(lastFailure(), "8: out of memory") << n;
        } else {
            EXPECT_EQ(result->containerCount, 500U) << n;
        }
        failures += error.code != 0 ? 1 : 0;
        LumoLib_FreeStorageContainerResult(result);
        LumoLib_Exit();
        if (untouched) {
            break;
        }
        ASSERT_LT(n, 10000) << "it never succeeds";
    }
    EXPECT_GT(failures, 10);
}

std::size_t openDescriptors() {
    std::filesystem::directory_iterator const entries("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

TEST_F(OutOfMemory, fault_62_descriptors_do_not_grow_with_requests) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        peer.done(request.getId());
        if (request.getId() % 2 == 0) {
            peer.hangUp();
        }
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    std::size_t const before = openDescriptors();
    for (int request = 0; request < 500; ++request) {
        LumoLib_DeactivateProvider("a", "p");
    }
    ASSERT_GT(daemon.connections(), 200);
    // The daemon's thread may be about to close a few.
    EXPECT_LE(openDescriptors(), before + 10);
}

} // namespace LumoTest
