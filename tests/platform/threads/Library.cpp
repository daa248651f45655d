// SPDX-License-Identifier: Apache-2.0
//
// liblumo serves one thread at a time, whichever that is; what it has counted may be looked at from any.
#include <atomic>
#include <cstdint>
#include <mutex>
#include <string>

#include "Host.h"
#include "lumolib/LastFailure.h"
#include "lumolib/LumoLib.h"
#include "lumolib/Progress.h"

namespace ThreadsTest {

namespace {

class Library : public Host {};

TEST_F(Library, ThreadsTakeTurns) {
    startDaemon();
    setenv("TOVI_ROOT", root().c_str(), 1);
    std::mutex turn;
    Crowd crowd;
    crowd.add(4, [&turn](int number) {
        for (int round = 0; round < 50; ++round) {
            std::lock_guard<std::mutex> const mine(turn);
            ASSERT_TRUE(LumoLib_Init(0, 0));
            StorageContainerResult *containers = nullptr;
            LumoErrorEx const listed = LumoLib_GetStorageContainer(0, nullptr, &containers);
            ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&listed)) << LumoLib_ErrorExStr(&listed);
            EXPECT_EQ(containers->containerCount, 3U);
            EXPECT_STREQ(containers->containers[0]->name, "gold");
            LumoLib_FreeStorageContainerResult(containers);
            std::string const provider = "nobody" + std::to_string(number);
            EXPECT_EQ(LumoLib_DeactivateProvider("array-north", provider.c_str()), 21);
            LumoLastFailure failure{};
            ASSERT_TRUE(LumoPlatform_LastFailure(&failure));
            EXPECT_EQ(failure.sentence, "no provider is registered under the name '" + provider + "'");
            if (round % 2 == number % 2) {
                LumoLib_Exit(); // the others go on with the session that stays open
            }
        }
    });
    crowd.finish();
    for (int open = 0; open < 100; ++open) {
        LumoLib_Exit();
    }
    EXPECT_EQ(LumoLib_DeactivateProvider("array-north", "nobody"), 14);
    EXPECT_EQ(stopDaemon(), 0);
}

TEST(Progress, IsLookedAtWhileItIsCounted) {
    constexpr std::uint64_t total = 100000;
    LumoPlatform_NoteProgress(0, total);
    std::atomic<bool> over{false};
    Crowd crowd;
    crowd.add(1, [&](int) {
        for (std::uint64_t count = 0; count < total; ++count) {
            LumoPlatform_NoteOneDone();
        }
        over = true;
    });
    crowd.add(3, [&](int) {
        for (std::uint64_t before = 0; !over;) {
            std::uint64_t done = 0;
            std::uint64_t all = 0;
            ASSERT_TRUE(LumoPlatform_Progress(&done, &all));
            EXPECT_EQ(all, total);
            EXPECT_GE(done, before);
            before = done;
        }
    });
    crowd.finish();
    std::uint64_t done = 0;
    std::uint64_t all = 0;
    EXPECT_TRUE(LumoPlatform_Progress(&done, &all));
    EXPECT_EQ(done, total);
    LumoPlatform_NoteProgress(0, 0);
}

} // namespace

} // namespace ThreadsTest
