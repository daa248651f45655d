// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;
using Wire::ErrorCode;

constexpr int nonExistent = 0;
constexpr int unconfirmed = 1;
constexpr int inaccessible = 2;
constexpr int accessible = 3;

class AccessibilityTest : public DaemonFixture {
protected:
    AccessibilityTest()
        : vendor_(addUsualVendor())
        , unbound_(vendor_->addVolume(containerIdOf(1), "unbound"))
        , bound_(vendor_->addVolume(containerIdOf(1), "bound")) {
        vendor_->volumes.at(bound_).boundTo = "e1";
    }
    Reply event(std::string const &endpoint, bool apd) {
        return ask([&](Wire::Request::Builder request) {
            auto fields = request.initProtocolEndpointEvent();
            fields.setEndpoint(endpoint.c_str());
            fields.setApd(apd);
        });
    }
    std::vector<std::string> names(Reply const &reply) {
        std::vector<std::string> texts;
        for (capnp::Text::Reader const name : reply.only().getContainerNames()) {
            texts.emplace_back(name.cStr());
        }
        return texts;
    }

    std::shared_ptr<FakeVendor> vendor_;
    std::string unbound_;
    std::string bound_;
};

TEST_F(AccessibilityTest, OneQueryAnswersForAllIds) {
    EXPECT_THAT(accessibility({bound_, "unknown", unbound_, bound_}),
                ElementsAre(accessible, nonExistent, accessible, accessible));
    EXPECT_EQ(vendor_->count("queryVirtualVolumesById 4"), 1);
    EXPECT_EQ(vendor_->count("queryVirtualVolume"), 1) << "no round trip for each volume";
}

TEST_F(AccessibilityTest, AnOutageCutsOffWhatIsBoundThroughTheEndpoint) {
    event("e1", true);
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(inaccessible, accessible));
    event("e2", true);
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(inaccessible, inaccessible));
    event("e1", false);
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(accessible, accessible));
}

TEST_F(AccessibilityTest, AnOutageThatTheStoreKeepsCounts) {
    store_.setEndpointOutage("e1", true);
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(inaccessible, accessible));
    store_.setEndpointOutage("e1", false);
    EXPECT_THAT(accessibility({bound_}), ElementsAre(accessible));
}

TEST_F(AccessibilityTest, TheStoreHasTheLastWordWhenItChanges) {
    event("e1", true);
    store_.setEndpointOutage("e1", true);
    EXPECT_THAT(accessibility({bound_}), ElementsAre(inaccessible));
    store_.setEndpointOutage("e1", false);
    EXPECT_THAT(accessibility({bound_}), ElementsAre(accessible));
    event("e1", true);
    store_.setOrkaContext("something else changes");
    EXPECT_THAT(accessibility({bound_}), ElementsAre(inaccessible)) << "an event outlives other changes";
}

TEST_F(AccessibilityTest, AnInaccessibleEndpointOfTheArrayIsNoPath) {
    vendor_->arrays[0].endpoints[0].isAccessible = false;
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(inaccessible, accessible));
}

TEST_F(AccessibilityTest, AnArrayWithoutEndpointsReachesNothing) {
    vendor_->arrays[0].endpoints.clear();
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(inaccessible, inaccessible));
}

TEST_F(AccessibilityTest, WhatNobodyCanBeAskedAboutIsUnconfirmed) {
    vendor_->failing.emplace("queryVirtualVolumesById",
                             Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_THAT(accessibility({bound_, "unknown"}), ElementsAre(unconfirmed, unconfirmed));
    vendor_->failing.clear();
    vendor_->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_THAT(accessibility({bound_, "unknown"}), ElementsAre(unconfirmed, unconfirmed));
}

TEST_F(AccessibilityTest, AnAnswerAboutFewerVolumesIsNone) {
    vendor_->swallowsAnswers = true;
    EXPECT_THAT(accessibility({bound_, "unknown"}), ElementsAre(unconfirmed, unconfirmed));
}

TEST_F(AccessibilityTest, AProviderThatNoLongerKnowsTheContainerDeniesItsVolumes) {
    vendor_->failing.emplace("queryVirtualVolumesById", Wire::Failure(ErrorCode::NoSuchContainer, "it went"));
    EXPECT_THAT(accessibility({bound_, "unknown"}), ElementsAre(nonExistent, nonExistent));
}

TEST_F(AccessibilityTest, VolumesOfAnOfflineProviderAreUnconfirmed) {
    inject("vp", "offline");
    EXPECT_THAT(accessibility({bound_, unbound_}), ElementsAre(unconfirmed, unconfirmed));
}

TEST_F(AccessibilityTest, AnArrayWithoutAnActiveProviderLeavesItsVolumesUnconfirmed) {
    inject("vp", "default", {{"a1", false}});
    EXPECT_THAT(accessibility({bound_}), ElementsAre(unconfirmed));
}

TEST_F(AccessibilityTest, AContainerThatEverybodyDeniesHasNoVolumes) {
    EXPECT_THAT(accessibility({bound_}, 2), ElementsAre(nonExistent));
    store_.removeProvider("vp");
    EXPECT_THAT(accessibility({bound_}, 2), ElementsAre(unconfirmed)) << "there is nobody to deny it";
}

TEST_F(AccessibilityTest, VolumesAreFoundOnWhicheverProviderHasThem) {
    auto const other = addVendor("other");
    other->arrays = {arrayOf("a2", {"e9"})};
    other->containers = {containerOf(1, "gold", {"a2"})};
    std::string const theirs = "00000000-0000-4000-9000-000000000001";
    Orka::VirtualVolume volume;
    volume.uuid = theirs;
    other->volumes.emplace(theirs, volume);
    EXPECT_THAT(accessibility({theirs, bound_, "unknown"}), ElementsAre(accessible, accessible, nonExistent));
    other->failing.emplace("queryVirtualVolumesById", Wire::Failure(ErrorCode::ProviderUnreachable, "cut"));
    EXPECT_THAT(accessibility({theirs, bound_, "unknown"}), ElementsAre(unconfirmed, accessible, unconfirmed));
    other->failing.clear();
    vendor_->failing.emplace("queryVirtualVolumesById", Wire::Failure(ErrorCode::ProviderUnreachable, "cut"));
    EXPECT_THAT(accessibility({theirs, bound_, "unknown"}), ElementsAre(accessible, unconfirmed, unconfirmed));
}

TEST_F(AccessibilityTest, NoIdsAreNoAnswers) {
    EXPECT_TRUE(accessibility({}).empty());
}

TEST_F(AccessibilityTest, TooManyIdsAreRefused) {
    Reply const reply = ask([](Wire::Request::Builder request) {
        auto check = request.initCheckLumoAccessibility();
        check.setContainerId(containerIdOf(1).c_str());
        check.initLumoIds(10001);
    });
    EXPECT_EQ(reply.code(), ErrorCode::InvalidArgument);
}

TEST_F(AccessibilityTest, AnEventTellsTheContainersOfTheEndpoint) {
    vendor_->arrays.push_back(arrayOf("a2", {"e3"}));
    vendor_->containers.push_back(containerOf(2, "silver", {"a1", "a2"}));
    vendor_->containers.push_back(containerOf(3, "bronze", {"a2"}));
    EXPECT_THAT(names(event("e1", true)), ElementsAre("gold", "silver"));
    EXPECT_THAT(names(event("e3", false)), ElementsAre("silver", "bronze"));
}

TEST_F(AccessibilityTest, AnEventThatASilentProviderMayKnowOfFailsWithThat) {
    auto const other = addVendor("other");
    other->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_EQ(event("e1", true).code(), ErrorCode::Success);
    Reply const unknown = event("e9", true);
    EXPECT_EQ(unknown.code(), ErrorCode::ProviderUnreachable);
    EXPECT_EQ(unknown.sentence(), "the wire is cut");
}

TEST_F(AccessibilityTest, AnEventOfAnUnknownEndpointIsRefused) {
    Reply const reply = event("e9", true);
    EXPECT_EQ(reply.code(), ErrorCode::NoSuchEndpoint);
    EXPECT_THAT(reply.sentence(), testing::HasSubstr("'e9'"));
}

} // namespace
