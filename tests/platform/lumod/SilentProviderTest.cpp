// SPDX-License-Identifier: Apache-2.0
//
// Of two providers one takes requests and never answers.
#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;

using Wire::ErrorCode;

class SilentProviderTest : public DaemonFixture {
protected:
    SilentProviderTest() {
        addUsualVendor();
        silent_->arrays = {arrayOf("a2", {"e3"})};
        silent_->containers = {containerOf(2, "silver", {"a2"})};
    }

    static void getAll(Wire::Request::Builder request) {
        request.setGetStorageContainer();
    }
    static void findSilver(Wire::Request::Builder request) {
        request.initFindStorageContainer().setContainerId(containerIdOf(2).c_str());
    }
    void stopAnswering() {
        silent_->hanging = {"queryStorageArray"};
    }
    /// What a provider's client does when the deadline is there.
    void giveUp() {
        silent_->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::DeadlineExceeded, "no answer in time"));
        silent_->answer();
        scope_.poll();
        silent_->failing.clear();
    }
    /// One request that waits as long as it may.
    std::vector<std::string> containersAfterWaiting() {
        Pending request = start(getAll);
        EXPECT_FALSE(request.promise.poll(scope_));
        advance(15 * kj::SECONDS);
        giveUp();
        return containersIn(finish(kj::mv(request)));
    }

    std::shared_ptr<FakeVendor> silent_ = addVendor("silent");
};

TEST_F(SilentProviderTest, OnlyTheFirstRequestWaitsForIt) {
    stopAnswering();
    EXPECT_THAT(containersAfterWaiting(), ElementsAre("gold@fake:vp[a1]"));
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(SilentProviderTest, WhatOnlyItKnowsIsRefusedWithTheReason) {
    stopAnswering();
    containersAfterWaiting();
    advance(3 * kj::SECONDS);
    Reply const reply = ask(findSilver);
    EXPECT_EQ(reply.code(), ErrorCode::ProviderUnreachable);
    EXPECT_EQ(reply.sentence(), "the provider 'silent' has been silent for 3 s and is left out until it answers");
}

TEST_F(SilentProviderTest, ItCountsAgainAsSoonAsItAnswers) {
    stopAnswering();
    containersAfterWaiting();
    scope_.poll();
    silent_->hanging.clear();
    silent_->answer();
    scope_.poll();
    EXPECT_TRUE(sink_.holds("the provider 'silent' answers again"));
    EXPECT_THAT(containers(), ElementsAre("silver@fake:silent[a2]", "gold@fake:vp[a1]"));
}

TEST_F(SilentProviderTest, ATrialThatIsNotAnsweredIsRepeated) {
    stopAnswering();
    containersAfterWaiting();
    scope_.poll();
    int const trials = silent_->count("queryStorageArray");
    advance(10 * kj::SECONDS);
    giveUp();
    EXPECT_EQ(silent_->count("queryStorageArray"), trials);
    advance(1 * kj::SECONDS);
    EXPECT_EQ(silent_->count("queryStorageArray"), trials + 1);
    containers();
    EXPECT_EQ(silent_->count("queryStorageArray"), trials + 1) << "requests do not add trials";
}

TEST_F(SilentProviderTest, AFailureInTimeIsAnAnswer) {
    stopAnswering();
    containersAfterWaiting();
    scope_.poll();
    silent_->hanging.clear();
    silent_->failing.emplace("queryStorageArray", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    silent_->answer();
    scope_.poll();
    EXPECT_EQ(ask(findSilver).sentence(), "the wire is cut");
}

TEST_F(SilentProviderTest, IsTriedNoMoreOnceItIsRemoved) {
    stopAnswering();
    containersAfterWaiting();
    scope_.poll();
    store_.removeProvider("silent");
    containers();
    int const trials = silent_->count("queryStorageArray");
    advance(10 * kj::SECONDS);
    giveUp();
    advance(1 * kj::SECONDS);
    EXPECT_EQ(silent_->count("queryStorageArray"), trials);
}

TEST_F(SilentProviderTest, AloneItIsWaitedForEveryTime) {
    store_.removeProvider("vp");
    stopAnswering();
    Pending first = start(getAll);
    EXPECT_FALSE(first.promise.poll(scope_));
    advance(30 * kj::SECONDS);
    giveUp();
    EXPECT_EQ(finish(kj::mv(first)).code(), ErrorCode::DeadlineExceeded);
    Pending second = start(getAll);
    EXPECT_FALSE(second.promise.poll(scope_));
    silent_->hanging.clear();
    silent_->answer();
    EXPECT_THAT(containersIn(finish(kj::mv(second))), ElementsAre("silver@fake:silent[a2]"));
}

} // namespace
