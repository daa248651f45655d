// SPDX-License-Identifier: Apache-2.0
#include <fstream>

#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;
using testing::IsEmpty;
using Wire::ErrorCode;

class StorageContainersTest : public DaemonFixture {
protected:
    static void getAll(Wire::Request::Builder request) {
        request.setGetStorageContainer();
    }
    Reply find(int container, std::vector<std::string> const &arrayIds = {}) {
        return ask([&](Wire::Request::Builder request) {
            auto wanted = request.initFindStorageContainer();
            wanted.setContainerId(containerIdOf(container).c_str());
            auto list = wanted.initArrayIds(static_cast<unsigned>(arrayIds.size()));
            for (unsigned place = 0; place < list.size(); ++place) {
                list.set(place, arrayIds[place].c_str());
            }
        });
    }
};

TEST_F(StorageContainersTest, NoStoreMeansNoContainers) {
    EXPECT_THAT(containers(), IsEmpty());
    EXPECT_FALSE(std::ifstream(store_.path()).good()) << "the daemon must not make the store";
}

TEST_F(StorageContainersTest, fault_62_WhatBreaksIsAFailureInWords) {
    auto const vendor = addUsualVendor();
    vendor->hanging = {"queryStorageArray"};
    auto const asked = [&] {
        Pending pending = start(getAll);
        scope_.poll();
        vendor->answer();
        return finish(std::move(pending));
    };
    vendor->breaks = [] { throw std::bad_alloc(); };
    Reply const exhausted = asked();
    EXPECT_EQ(exhausted.code(), ErrorCode::OutOfMemory);
    EXPECT_EQ(exhausted.sentence(), "queryStorageArray of provider 'vp' broke: the daemon is out of memory");
    vendor->breaks = [] { throw std::runtime_error("a defect"); };
    Reply const defective = asked();
    EXPECT_EQ(defective.code(), ErrorCode::InternalError);
    EXPECT_THAT(defective.sentence(), testing::HasSubstr("a defect"));
}

TEST_F(StorageContainersTest, AProviderWithoutArraysInItsRecordServesAllThatItExports) {
    auto const vendor = addUsualVendor();
    vendor->arrays.push_back(arrayOf("a2", {}));
    vendor->containers.push_back(containerOf(2, "silver", {"a1", "a2"}));
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]", "silver@fake:vp[a1,a2]"));
}

TEST_F(StorageContainersTest, ARecordWithArraysServesOnlyThose) {
    auto const vendor = addVendor("vp", {{"a2", true, 0}});
    vendor->arrays = {arrayOf("a1", {}), arrayOf("a2", {})};
    vendor->containers = {containerOf(1, "gold", {"a1"}), containerOf(2, "silver", {"a1", "a2"})};
    EXPECT_THAT(containers(), ElementsAre("silver@fake:vp[a2]"));
}

TEST_F(StorageContainersTest, OfSeveralProvidersNoneMayUseAllOfTheTime) {
    auto const alone = addVendor("alone", {});
    containers();
    EXPECT_EQ(alone->contexts.back().deadline, timer_.now() + 30 * kj::SECONDS);
    auto const other = addVendor("other", {});
    containers();
    for (auto const &vendor : {alone, other}) {
        EXPECT_EQ(vendor->contexts.back().deadline, timer_.now() + 15 * kj::SECONDS);
    }
}

TEST_F(StorageContainersTest, AContainerWithoutArraysIsExported) {
    auto const vendor = addUsualVendor();
    vendor->containers = {containerOf(1, "bare", {})};
    EXPECT_THAT(containers(), ElementsAre("bare@fake:vp[]"));
}

TEST_F(StorageContainersTest, AContainerOnArraysOfSeveralProvidersIsToldOnce) {
    auto const one = addVendor("one", {{"a1", true, 0}});
    auto const two = addVendor("two", {{"a2", true, 0}});
    for (auto const &vendor : {one, two}) {
        vendor->arrays = {arrayOf("a1", {}), arrayOf("a2", {})};
        vendor->containers = {containerOf(1, "gold", {"a2", "a1"})};
    }
    EXPECT_THAT(containers(), ElementsAre("gold@fake:one[a1,a2]"));
}

TEST_F(StorageContainersTest, TheHighestPriorityServesAndTheNameBreaksATie) {
    for (auto const &[name, priority] : {std::pair{"b", 5}, std::pair{"c", 7}, std::pair{"a", 7}, std::pair{"d", -1}}) {
        auto const vendor = addVendor(name, {{"a1", true, priority}});
        vendor->arrays = {arrayOf("a1", {})};
        vendor->containers = {containerOf(1, "gold", {"a1"})};
    }
    EXPECT_THAT(containers(), ElementsAre("gold@fake:a[a1]"));
}

TEST_F(StorageContainersTest, AnInactiveProviderServesNothing) {
    auto const vendor = addVendor("vp", {{"a1", false, 0}});
    vendor->arrays = {arrayOf("a1", {})};
    vendor->containers = {containerOf(1, "gold", {"a1"})};
    EXPECT_THAT(containers(), IsEmpty());
    Reply const found = find(1);
    EXPECT_EQ(found.code(), ErrorCode::NoActiveProvider);
    EXPECT_THAT(found.sentence(), testing::HasSubstr("a1"));
}

TEST_F(StorageContainersTest, AFailingProviderIsLeftOutWhenOthersAnswer) {
    addUsualVendor();
    addVendor("dead")->failing.emplace("queryStorageArray",
                                       Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    EXPECT_TRUE(sink_.holds("trace-1 left out the provider 'dead': the wire is cut"));
}

TEST_F(StorageContainersTest, WhenNoProviderAnswersTheFirstFailureIsTold) {
    addVendor("dead")->failing.emplace("queryStorageContainer",
                                       Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    Reply const reply = ask(getAll);
    EXPECT_EQ(reply.code(), ErrorCode::ProviderUnreachable);
    EXPECT_EQ(reply.sentence(), "the wire is cut");
}

TEST_F(StorageContainersTest, AUrlThatNobodySpeaksIsAFailureOfThatProvider) {
    store_.putProviders({{"odd", "gopher://x", {}, {}}});
    Reply const reply = ask(getAll);
    EXPECT_EQ(reply.code(), ErrorCode::InvalidArgument);
    EXPECT_EQ(reply.sentence(), "no provider speaks gopher://x");
    addUsualVendor();
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(StorageContainersTest, RegistrationsAndRemovalsAreNoticed) {
    addUsualVendor();
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    store_.removeProvider("vp");
    EXPECT_THAT(containers(), IsEmpty());
}

TEST_F(StorageContainersTest, AChangedListIsNoticedByItsVersion) {
    auto const vendor = addUsualVendor();
    EXPECT_EQ(containers().size(), 1U);
    vendor->containers.push_back(containerOf(2, "silver", {"a1"}));
    ++vendor->version;
    EXPECT_EQ(containers().size(), 2U);
}

TEST_F(StorageContainersTest, EndpointsInAnOutageAreToldAsInaccessible) {
    addUsualVendor();
    store_.setEndpointOutage("e1", true);
    Reply const reply = ask(getAll);
    auto const endpoints = reply.at(0).getStorageArrays()[0].getEndpoints();
    EXPECT_STREQ(endpoints[0].getUid().cStr(), "e1");
    EXPECT_FALSE(endpoints[0].getIsAccessible());
    EXPECT_TRUE(endpoints[1].getIsAccessible());
    EXPECT_TRUE(endpoints[0].hasText1());
    EXPECT_FALSE(endpoints[0].hasText2()) << "what the array does not tell stays null";
}

TEST_F(StorageContainersTest, LongListsComeInChunks) {
    auto const vendor = addUsualVendor();
    vendor->containers.clear();
    for (int number = 0; number < 2500; ++number) {
        vendor->containers.push_back(containerOf(number, "c" + std::to_string(number), {"a1"}));
    }
    Reply const reply = ask(getAll);
    ASSERT_EQ(reply.messages.size(), 4U);
    EXPECT_TRUE(reply.at(0).isStorageArrays());
    EXPECT_EQ(reply.at(1).getStorageContainers().size(), 1000U);
    EXPECT_EQ(reply.at(3).getStorageContainers().size(), 500U);
    EXPECT_EQ(containersIn(reply).back(), "c2499@fake:vp[a1]");
}

TEST_F(StorageContainersTest, ChunksAreBoundedInBytesToo) {
    auto const vendor = addUsualVendor();
    vendor->containers.clear();
    for (int number = 0; number < 30; ++number) {
        vendor->containers.push_back(containerOf(number, std::string(100'000, 'n'), {"a1"}));
    }
    Reply const reply = ask(getAll);
    EXPECT_GE(reply.messages.size(), 4U);
    EXPECT_EQ(containersIn(reply).size(), 30U);
}

TEST_F(StorageContainersTest, FindTellsTheOneContainer) {
    addUsualVendor();
    EXPECT_THAT(containersIn(find(1, {"a1"})), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(StorageContainersTest, FindTellsWhatIsNotThere) {
    addUsualVendor();
    EXPECT_EQ(find(2).code(), ErrorCode::NoSuchContainer);
    EXPECT_EQ(find(1, {"a1", "a9"}).code(), ErrorCode::NoSuchArray);
    Reply const bad =
        ask([](Wire::Request::Builder request) { request.initFindStorageContainer().setContainerId("no id"); });
    EXPECT_EQ(bad.code(), ErrorCode::InvalidArgument);
}

TEST_F(StorageContainersTest, FindBlamesTheProviderThatMayKnowMore) {
    addUsualVendor();
    addVendor("dead")->failing.emplace("queryStorageArray",
                                       Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_EQ(find(2).code(), ErrorCode::ProviderUnreachable);
    EXPECT_EQ(find(1).code(), ErrorCode::Success);
}

TEST_F(StorageContainersTest, ASlowProviderKeepsOtherRequestsWaitingForNothing) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    Pending slow = start(getAll);
    EXPECT_FALSE(slow.promise.poll(scope_));
    Reply const pong = ask([](Wire::Request::Builder request) { request.setPing(); });
    EXPECT_STREQ(pong.only().getPong().getVersion().cStr(), "1.2.3");
    vendor->answer();
    EXPECT_THAT(containersIn(finish(kj::mv(slow))), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(StorageContainersTest, TheDeadlineAndTheContextGoWithEveryOperation) {
    auto const vendor = addUsualVendor();
    store_.setOrkaContext("nexa-1");
    containers();
    ASSERT_FALSE(vendor->contexts.empty());
    for (Orka::CallContext const &context : vendor->contexts) {
        EXPECT_EQ(context.orkaContext, "nexa-1");
        EXPECT_EQ(context.deadline, timer_.now() + 30 * kj::SECONDS);
    }
}

TEST_F(StorageContainersTest, AProviderIsToldTheContextOnceForEachChange) {
    auto const vendor = addUsualVendor();
    containers();
    EXPECT_EQ(vendor->count("setContext"), 0) << "nobody's is what a provider assumes";
    store_.setOrkaContext("nexa-1");
    containers();
    containers();
    EXPECT_EQ(vendor->count("setContext nexa-1"), 1);
    store_.clearOrkaContext();
    containers();
    EXPECT_EQ(vendor->count("setContext -"), 1);
}

} // namespace
