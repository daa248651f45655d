// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

using namespace Orka;

class RepeatingAMutation : public OrkaTest {
protected:
    static VolumeSpec spec(std::string const &directoryName) {
        VolumeSpec made;
        made.containerId = goldId;
        made.directoryName = directoryName;
        made.profile = "p";
        return made;
    }

    ArrayFile file_{makeArray(), std::chrono::seconds(5), countingUuids()};
};

TEST_F(RepeatingAMutation, fault_42_createsOneVolumeAndGivesTheSameAnswer) {
    auto const first = file_.createVolume("key", spec("vm"));
    EXPECT_EQ(file_.createVolume("key", spec("vm")), first);
    EXPECT_EQ(ArrayFile(at("test.array")).createVolume("key", spec("vm")), first);
    EXPECT_EQ(file_.counts().configVolumes, 3);
}

TEST_F(RepeatingAMutation, givesTheFirstAnswerWhateverBecameOfTheVolume) {
    auto const first = file_.createVolume("key", spec("vm"));
    file_.bindVolume("", goldId, first.uuid, "pe-1");
    EXPECT_EQ(file_.createVolume("key", spec("vm")), first);
    file_.unbindVolume("", goldId, first.uuid);
    file_.deleteVolume("", goldId, first.uuid);
    EXPECT_EQ(file_.createVolume("key", spec("vm")), first);
    EXPECT_EQ(file_.counts().configVolumes, 2);
}

TEST_F(RepeatingAMutation, deletesOnce) {
    file_.deleteVolume("key", goldId, webId);
    file_.deleteVolume("key", goldId, webId);
    EXPECT_EQ(codeOf([&] { file_.deleteVolume("other", goldId, webId); }), Wire::ErrorCode::NoSuchVolume);
}

TEST_F(RepeatingAMutation, doesNotBindAgainWhatWasUnboundSince) {
    file_.bindVolume("bind", goldId, webId, "pe-1");
    file_.unbindVolume("unbind", goldId, webId);
    file_.bindVolume("bind", goldId, webId, "pe-1");
    EXPECT_EQ(file_.volume(goldId, webId).boundTo, std::nullopt);
    file_.bindVolume("bind again", goldId, webId, "pe-1");
    file_.unbindVolume("unbind", goldId, webId);
    EXPECT_EQ(file_.volume(goldId, webId).boundTo, "pe-1");
}

TEST_F(RepeatingAMutation, withoutAKeyIsANewMutation) {
    file_.createVolume("", spec("vm"));
    EXPECT_EQ(codeOf([&] { file_.createVolume("", spec("vm")); }), Wire::ErrorCode::AlreadyExists);
}

TEST_F(RepeatingAMutation, triesAnewWhatFailed) {
    EXPECT_EQ(codeOf([&] { file_.createVolume("key", spec("web")); }), Wire::ErrorCode::AlreadyExists);
    file_.deleteVolume("", goldId, webId);
    EXPECT_EQ(file_.createVolume("key", spec("web")).directoryName, "web");
}

TEST_F(RepeatingAMutation, refusesAKeyThatComesWithAnotherRequest) {
    file_.createVolume("key", spec("vm"));
    EXPECT_EQ(failureOf([&] { file_.createVolume("key", spec("vm2")); }),
              "the idempotency key key was used for another request already");
    auto withoutProfile = spec("vm");
    withoutProfile.profile.reset();
    auto emptyProfile = spec("vm");
    emptyProfile.profile = "";
    for (auto const &other : {withoutProfile, emptyProfile}) {
        EXPECT_EQ(codeOf([&] { file_.createVolume("key", other); }), Wire::ErrorCode::InvalidArgument);
    }
    EXPECT_EQ(codeOf([&] { file_.deleteVolume("key", goldId, webId); }), Wire::ErrorCode::InvalidArgument);
    EXPECT_TRUE(file_.presence(goldId, {webId})[0].exists);
}

TEST_F(RepeatingAMutation, forgetsTheOldestKeysAndKeepsTheLatest10000) {
    auto const created = file_.createVolume("oldest", spec("vm"));
    {
        Stranger stranger(at("test.array"));
        stranger.execute("WITH RECURSIVE n(i) AS (VALUES (1) UNION ALL SELECT i + 1 FROM n WHERE i < 9999) "
                         "INSERT INTO answer (idempotency_key, request) SELECT 'k' || i, 'r' FROM n");
    }
    EXPECT_EQ(file_.createVolume("oldest", spec("vm")), created);
    file_.unbindVolume("newest", goldId, webId);
    // The 10001st key has pushed the first one out.
    EXPECT_EQ(codeOf([&] { file_.createVolume("oldest", spec("vm")); }), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(codeOf([&] { file_.unbindVolume("k1", goldId, webId); }), Wire::ErrorCode::InvalidArgument);
}
