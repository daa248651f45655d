// SPDX-License-Identifier: Apache-2.0
#include "MutationQueue.h"

#include <string>

#include <gtest/gtest.h>

namespace {

using Lumod::Answer;
using Lumod::Done;
using Lumod::MutationQueue;
using Lumod::Outcome;

class MutationQueueTest : public testing::Test {
protected:
    ~MutationQueueTest() noexcept override = default;

    /// A task that tells when it begins and ends when its gate opens.
    struct Task {
        kj::Own<kj::PromiseFulfiller<void>> gate;
        kj::Promise<Outcome<Done>> promise;
    };

    Task enqueue(char letter) {
        auto gate = kj::newPromiseAndFulfiller<void>();
        auto promise = queue_.inTurn([this, letter, wait = kj::mv(gate.promise)]() mutable {
            begun_ += letter;
            return wait.then([]() -> Outcome<Done> { return Done{}; });
        });
        return {kj::mv(gate.fulfiller), promise.eagerlyEvaluate(nullptr)};
    }

    kj::EventLoop loop_;
    kj::WaitScope scope_{loop_};
    MutationQueue queue_;
    std::string begun_;
};

TEST_F(MutationQueueTest, RunsOneAfterTheOtherInTheOrderOfComing) {
    Task a = enqueue('a');
    Task b = enqueue('b');
    Task c = enqueue('c');
    scope_.poll();
    EXPECT_EQ(begun_, "a");
    c.gate->fulfill();
    a.gate->fulfill();
    scope_.poll();
    EXPECT_EQ(begun_, "ab");
    b.gate->fulfill();
    scope_.poll();
    EXPECT_EQ(begun_, "abc");
    scope_.poll();
    EXPECT_FALSE(queue_.isBusy());
}

TEST_F(MutationQueueTest, OneThatIsDroppedWhileItWaitsIsPassedOver) {
    Task a = enqueue('a');
    {
        Task dropped = enqueue('x');
        scope_.poll();
    }
    Task b = enqueue('b');
    a.gate->fulfill();
    scope_.poll();
    EXPECT_EQ(begun_, "ab");
}

TEST_F(MutationQueueTest, OneThatIsDroppedInItsTurnEndsIt) {
    Task b{kj::Own<kj::PromiseFulfiller<void>>(), Outcome<Done>(Done{})};
    {
        Task a = enqueue('a');
        b = enqueue('b');
        scope_.poll();
        EXPECT_EQ(begun_, "a");
    }
    scope_.poll();
    EXPECT_EQ(begun_, "ab");
}

TEST_F(MutationQueueTest, AFailureEndsTheTurn) {
    auto failed =
        queue_.inTurn([]() -> Answer<Done> { return Outcome<Done>(Wire::Failure(Wire::ErrorCode::InUse, "no")); });
    EXPECT_FALSE(failed.wait(scope_).ok());
    Task a = enqueue('a');
    scope_.poll();
    EXPECT_EQ(begun_, "a");
}

} // namespace
