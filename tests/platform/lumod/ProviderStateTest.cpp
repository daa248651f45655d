// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Wire::ErrorCode;

/// Two providers that export the same array and container.
class ProviderStateTest : public DaemonFixture {
protected:
    void addTwins(int32_t firstPriority, int32_t secondPriority) {
        for (auto const &[name, priority] : {std::pair{"one", firstPriority}, std::pair{"two", secondPriority}}) {
            auto const vendor = addVendor(name, {{"a1", true, priority}});
            vendor->arrays = {arrayOf("a1", {"e1"})};
            vendor->containers = {containerOf(1, "gold", {"a1"})};
        }
    }
    Reply activate(std::string const &provider, std::string const &arrayId, std::string const &activeUrl = {}) {
        return ask([&](Wire::Request::Builder request) {
            auto activation = request.initActivateProvider();
            activation.setArrayId(arrayId.c_str());
            activation.setProviderName(provider.c_str());
            activation.setActiveProviderUrl(activeUrl.c_str());
        });
    }
    Reply deactivate(std::string const &provider, std::string const &arrayId) {
        return ask([&](Wire::Request::Builder request) {
            auto deactivation = request.initDeactivateProvider();
            deactivation.setArrayId(arrayId.c_str());
            deactivation.setProviderName(provider.c_str());
        });
    }
};

TEST_F(ProviderStateTest, ActivationTakesOverFromAHigherPriorityUntilItIsTakenBack) {
    addTwins(9, 1);
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
    EXPECT_TRUE(activate("two", "a1").only().isDone());
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
    EXPECT_TRUE(deactivate("two", "a1").only().isDone());
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
}

TEST_F(ProviderStateTest, DeactivationLeavesTheArrayToTheNextPriority) {
    addTwins(9, 1);
    deactivate("one", "a1");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
    deactivate("two", "a1");
    EXPECT_THAT(containers(), IsEmpty());
    activate("one", "a1");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
}

TEST_F(ProviderStateTest, TheUrlMustBeThatOfTheActiveProvider) {
    addTwins(9, 1);
    Reply const wrong = activate("two", "a1", "fake:two");
    EXPECT_EQ(wrong.code(), ErrorCode::NotTheActiveProvider);
    EXPECT_THAT(wrong.sentence(), HasSubstr("fake:one"));
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
    EXPECT_EQ(activate("two", "a1", "fake:one").code(), ErrorCode::Success);
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
}

TEST_F(ProviderStateTest, AProviderThatDiedIsStillTheActiveOneToTakeOverFrom) {
    addTwins(9, 1);
    vendors_.at("fake:one")
        ->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_EQ(activate("two", "a1", "fake:two").code(), ErrorCode::NotTheActiveProvider);
    EXPECT_EQ(activate("two", "a1", "fake:one").code(), ErrorCode::Success);
    vendors_.at("fake:one")->failing.clear();
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
}

TEST_F(ProviderStateTest, UnknownProvidersAndArraysAreNamed) {
    addTwins(1, 2);
    EXPECT_EQ(activate("three", "a1").code(), ErrorCode::NoSuchProvider);
    EXPECT_THAT(activate("three", "a1").sentence(), HasSubstr("'three'"));
    EXPECT_EQ(activate("one", "a9").code(), ErrorCode::NoSuchArray);
    EXPECT_EQ(deactivate("three", "a1").code(), ErrorCode::NoSuchProvider);
    EXPECT_EQ(deactivate("one", "a9").code(), ErrorCode::NoSuchArray);
    addUsualVendor();
    EXPECT_EQ(deactivate("vp", "a9").code(), ErrorCode::NoSuchArray) << "it exports no such array";
    EXPECT_EQ(deactivate("vp", "a1").code(), ErrorCode::Success);
}

TEST_F(ProviderStateTest, AChangedRecordForgetsWhatWasActivated) {
    addTwins(9, 1);
    activate("two", "a1");
    store_.putProviders({{"two", "fake:two", {}, {{"a1", false, 20}}}});
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
}

TEST_F(ProviderStateTest, AnOfflineProviderExportsNothingAndIsNotAsked) {
    auto const vendor = addUsualVendor();
    EXPECT_TRUE(inject("vp", "offline").only().isDone());
    vendor->calls.clear();
    EXPECT_THAT(containers(), IsEmpty());
    EXPECT_THAT(vendor->calls, IsEmpty());
    inject("vp", "default");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(ProviderStateTest, TheOtherProviderTakesOverFromOneThatIsOffline) {
    addTwins(9, 1);
    inject("one", "offline");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
    inject("one", "online");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
}

TEST_F(ProviderStateTest, RequestsForAVolumeOfAnOfflineProviderFailWithThat) {
    auto const vendor = addUsualVendor();
    std::string const uuid = vendor->addVolume(containerIdOf(1), "vm");
    inject("vp", "offline");
    Reply const reply = volumeRequest("info", uuid);
    EXPECT_EQ(reply.code(), ErrorCode::ProviderOffline);
    EXPECT_THAT(reply.sentence(), HasSubstr("'vp'"));
}

TEST_F(ProviderStateTest, AProviderOutOfSyncIsReadButTakesNoChanges) {
    auto const vendor = addUsualVendor();
    std::string const uuid = vendor->addVolume(containerIdOf(1), "vm");
    inject("vp", "syncError");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    EXPECT_EQ(volumeRequest("info", uuid).code(), ErrorCode::Success);
    EXPECT_EQ(volumeRequest("bind", uuid).code(), ErrorCode::ProviderBusy);
    EXPECT_EQ(volumeRequest("delete", uuid).code(), ErrorCode::ProviderBusy);
    EXPECT_EQ(vendor->volumes.count(uuid), 1U);
}

TEST_F(ProviderStateTest, AProviderInAnUnknownStateServesButConfirmsNothing) {
    auto const vendor = addUsualVendor();
    std::string const uuid = vendor->addVolume(containerIdOf(1), "vm");
    inject("vp", "unknown");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    EXPECT_THAT(accessibility({uuid, "no such id"}), ElementsAre(1, 1));
    EXPECT_EQ(volumeRequest("bind", uuid).code(), ErrorCode::Success);
}

TEST_F(ProviderStateTest, InjectedArrayFlagsHideTheRecordsOnes) {
    addTwins(9, 1);
    inject("one", "default", {{"a1", false}});
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
    inject("two", "default", {{"a1", false}});
    EXPECT_THAT(containers(), IsEmpty());
    inject("one", "default");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]")) << "default without arrays takes the flags back";
}

TEST_F(ProviderStateTest, NobodyIsTakenOverFromWhereNobodyIsActive) {
    addTwins(9, 1);
    inject("one", "default", {{"a1", false}});
    inject("two", "default", {{"a1", false}});
    Reply const refused = activate("one", "a1", "fake:two");
    EXPECT_EQ(refused.code(), ErrorCode::NotTheActiveProvider);
    EXPECT_EQ(refused.sentence(), "no provider is active for the storage array a1, so fake:two is not");
}

TEST_F(ProviderStateTest, AnInjectionNeedsNoUrl) {
    addTwins(9, 1);
    Reply const injected = ask([](Wire::Request::Builder request) {
        auto injection = request.initVendorProviderInjectFault();
        injection.setProviderName("one");
        injection.setStatus("offline");
    });
    EXPECT_TRUE(injected.only().isDone());
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
}

TEST_F(ProviderStateTest, AStatusAloneKeepsTheFlags) {
    addTwins(9, 1);
    inject("one", "default", {{"a1", false}});
    inject("one", "online");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
}

TEST_F(ProviderStateTest, InjectionRefusesWhatItDoesNotKnow) {
    addTwins(9, 1);
    Reply const badWord = inject("one", "Offline");
    EXPECT_EQ(badWord.code(), ErrorCode::InvalidArgument);
    EXPECT_THAT(badWord.sentence(), HasSubstr("'Offline'"));
    EXPECT_EQ(inject("three", "offline").code(), ErrorCode::NoSuchProvider);
    EXPECT_EQ(inject("one", "offline", {{"a9", true}}).code(), ErrorCode::NoSuchArray);
    Reply const otherUrl = ask([](Wire::Request::Builder request) {
        auto injection = request.initVendorProviderInjectFault();
        injection.setProviderName("one");
        injection.setProviderUrl("fake:two");
        injection.setStatus("offline");
    });
    EXPECT_EQ(otherUrl.code(), ErrorCode::NoSuchProvider);
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1]"));
}

TEST_F(ProviderStateTest, AProviderThatIsUnreachableGivesWayToTheNext) {
    addTwins(9, 1);
    vendors_.at("fake:one")
        ->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]"));
}

TEST_F(ProviderStateTest, AProviderIsKeptWhileItsUrlStaysTheSame) {
    addUsualVendor();
    inject("vp", "offline");
    store_.putProviders({{"vp", "fake:vp", {}, {{"a1", true, 3}}}});
    EXPECT_THAT(containers(), IsEmpty()) << "still offline";
    addTwins(1, 2);
    store_.putProviders({{"vp", "fake:one", {}, {}}});
    EXPECT_THAT(containers(), ElementsAre("gold@fake:two[a1]")) << "another URL is another provider";
}

} // namespace
