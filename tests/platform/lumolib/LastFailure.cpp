// SPDX-License-Identifier: Apache-2.0
#include "lumolib/LastFailure.h"

#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

class LastFailure : public Host {};

TEST_F(LastFailure, is_none_at_first) {
    LumoLastFailure failure{77, nullptr, nullptr};
    EXPECT_FALSE(LumoPlatform_LastFailure(&failure));
    EXPECT_EQ(failure.code, 77);
    EXPECT_FALSE(LumoPlatform_LastFailure(nullptr));
}

TEST_F(LastFailure, keeps_code_sentence_and_command) {
    set("TOVI_REQUEST_ID", "command-9");
    LumoPlatform_NoteFailure(24, "no volume v");
    LumoLastFailure failure{};
    ASSERT_TRUE(LumoPlatform_LastFailure(&failure));
    EXPECT_EQ(failure.code, 24);
    EXPECT_STREQ(failure.sentence, "no volume v");
    EXPECT_STREQ(failure.requestId, "command-9");
}

TEST_F(LastFailure, is_the_newest_one_until_it_is_cleared) {
    LumoPlatform_NoteFailure(1, "first");
    LumoPlatform_NoteFailure(2, "second");
    EXPECT_EQ(lastFailure(), "2: second");
    LumoPlatform_ClearLastFailure();
    EXPECT_EQ(lastFailure(), "none");
}

TEST_F(LastFailure, may_be_noted_without_texts) {
    LumoPlatform_NoteFailure(7, nullptr);
    LumoLastFailure failure{};
    ASSERT_TRUE(LumoPlatform_LastFailure(&failure));
    EXPECT_STREQ(failure.sentence, "");
    EXPECT_STREQ(failure.requestId, "");
}

TEST_F(LastFailure, survives_a_request_that_succeeds) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        if (request.isDeactivateProvider()) {
            peer.failure(request.getId(), 21, "no provider vp is registered");
        } else {
            peer.done(request.getId());
        }
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "vp"), 21);
    EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(true));
    EXPECT_EQ(lastFailure(), "21: no provider vp is registered");
}

TEST_F(LastFailure, cuts_a_long_sentence_before_a_character_that_does_not_fit) {
    std::string const start(2046, 'x');
    LumoPlatform_NoteFailure(1, (start + "\xC3\xA4").c_str());
    EXPECT_EQ(lastFailure(), "1: " + start);
    LumoPlatform_NoteFailure(1, (start + "a\xC3\xA4").c_str());
    EXPECT_EQ(lastFailure(), "1: " + start + "a");
    LumoPlatform_NoteFailure(1, std::string(3000, '\x80').c_str());
    EXPECT_EQ(lastFailure(), "1: " + std::string(2047, '\x80'));
}

} // namespace LumoTest
