// SPDX-License-Identifier: Apache-2.0
#include "FaultRules.h"

#include <gtest/gtest.h>

namespace {

using Lumod::Operation;
using Wire::ErrorCode;

class FaultRulesTest : public testing::Test {
protected:
    ~FaultRulesTest() noexcept override = default;

    /// Asks before so many operations; a cross for each one that was struck.
    std::string strikes(Operation operation, int count) {
        std::string result;
        for (int index = 0; index < count; ++index) {
            result += rules_.strike(operation, "vp") ? 'x' : '.';
        }
        return result;
    }
    void advance(kj::Duration duration) {
        timer_.advanceTo(timer_.now() + duration);
    }
    ErrorCode codeOfAdd(char const *fault, char const *operation, int frequency = 1, int timeMs = -1) {
        try {
            rules_.add(fault, operation, frequency, timeMs);
        } catch (Wire::Failure const &failure) {
            return failure.code();
        }
        return ErrorCode::Success;
    }
    ErrorCode codeOfModify(char const *fault, char const *operation, int frequency, int timeMs) {
        try {
            rules_.modify(fault, operation, frequency, timeMs);
        } catch (Wire::Failure const &failure) {
            return failure.code();
        }
        return ErrorCode::Success;
    }

    kj::TimerImpl timer_{kj::origin<kj::TimePoint>()};
    Lumod::FaultRules rules_{timer_};
};

TEST_F(FaultRulesTest, StrikesEveryNthOperation) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 3, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 7), "..x..x.");
}

TEST_F(FaultRulesTest, StrikesEveryOperationWithFrequencyOne) {
    rules_.add("TIMEOUT", "getMetadata", 1, 0);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::GetMetadata, 3), "xxx");
}

TEST_F(FaultRulesTest, StrikesOnceTheTimeSinceTheLastStrikeExceedsTheLimit) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", -1, 500);
    rules_.setEnabled(true);
    advance(500 * kj::MILLISECONDS);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), ".");
    advance(1 * kj::MILLISECONDS);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 2), "x.");
    advance(501 * kj::MILLISECONDS);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), "x");
}

TEST_F(FaultRulesTest, BothTriggersStrikeAtWhicheverComesFirstAndStartAnewTogether) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 3, 100);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 3), "..x");
    advance(101 * kj::MILLISECONDS);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 3), "x..");
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), "x");
}

TEST_F(FaultRulesTest, AWildcardCoversEveryOperationThatTheFaultIsLegalFor) {
    rules_.add("OUT_OF_RESOURCE", "*", 1, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), "x");
    EXPECT_EQ(strikes(Operation::BindVirtualVolume, 1), "x");
    EXPECT_EQ(strikes(Operation::QueryStorageContainer, 1), ".");
    EXPECT_EQ(strikes(Operation::DeleteVirtualVolume, 1), ".");
}

TEST_F(FaultRulesTest, AWildcardCountsItsOperationsTogether) {
    rules_.add("STORAGE_FAULT", "*", 2, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::QueryStorageArray, 1), ".");
    EXPECT_EQ(strikes(Operation::QueryStorageContainer, 1), "x");
}

TEST_F(FaultRulesTest, TheExactRuleIsTriedBeforeTheWildcard) {
    rules_.add("STORAGE_FAULT", "*", 1, -1);
    rules_.add("TIMEOUT", "createVirtualVolume", 2, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(rules_.strike(Operation::CreateVirtualVolume, "vp")->code(), ErrorCode::FaultStorageFault);
    EXPECT_EQ(rules_.strike(Operation::CreateVirtualVolume, "vp")->code(), ErrorCode::FaultTimeout);
}

TEST_F(FaultRulesTest, TheSentenceNamesFaultOperationAndProvider) {
    rules_.add("LOST_SESSION", "setContext", 1, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(rules_.strike(Operation::SetContext, "vp")->sentence(),
              "injected fault LOST_SESSION in setContext of provider 'vp'");
}

TEST_F(FaultRulesTest, NothingStrikesOrCountsWhileDisabledAndRulesAreKept) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 2, -1);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 5), ".....");
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 2), ".x");
    rules_.setEnabled(false);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 3), "...");
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 2), ".x");
}

TEST_F(FaultRulesTest, EnablingOnceMoreDoesNotStartTheRulesAnew) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 2, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), ".");
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), "x");
}

TEST_F(FaultRulesTest, AddRefusesWhatCannotBe) {
    EXPECT_EQ(codeOfAdd("NO_FAULT", "createVirtualVolume"), ErrorCode::UnknownFault);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "createEverything"), ErrorCode::UnknownOperation);
    EXPECT_EQ(codeOfAdd("OUT_OF_RESOURCE", "getMetadata"), ErrorCode::IllegalFault);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "createVirtualVolume", 0, -1), ErrorCode::InvalidArgument);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "createVirtualVolume"), ErrorCode::Success);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "createVirtualVolume", 9), ErrorCode::RuleExists);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "*"), ErrorCode::Success);
    EXPECT_EQ(codeOfAdd("STORAGE_FAULT", "*"), ErrorCode::RuleExists);
}

TEST_F(FaultRulesTest, ModifyChangesTheTriggersAndStartsTheRuleAnew) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 2, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), ".");
    EXPECT_EQ(codeOfModify("STORAGE_FAULT", "createVirtualVolume", 3, -1), ErrorCode::Success);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 3), "..x");
}

TEST_F(FaultRulesTest, ModifyWithoutATriggerRemoves) {
    rules_.add("STORAGE_FAULT", "createVirtualVolume", 1, -1);
    rules_.setEnabled(true);
    EXPECT_EQ(codeOfModify("STORAGE_FAULT", "createVirtualVolume", -1, -1), ErrorCode::Success);
    EXPECT_EQ(strikes(Operation::CreateVirtualVolume, 1), ".");
    EXPECT_EQ(codeOfModify("STORAGE_FAULT", "createVirtualVolume", -1, -1), ErrorCode::NoSuchRule);
    EXPECT_TRUE(rules_.rules().empty());
}

TEST_F(FaultRulesTest, ModifyOfAnUnknownRuleIsRefused) {
    EXPECT_EQ(codeOfModify("STORAGE_FAULT", "*", 1, -1), ErrorCode::NoSuchRule);
    EXPECT_EQ(codeOfModify("NO_FAULT", "*", 1, -1), ErrorCode::UnknownFault);
}

TEST(FaultNames, EveryFaultAndOperationIsFoundByItsName) {
    for (std::size_t at = 0; at < Lumod::faultCount; ++at) {
        auto const fault = static_cast<Lumod::Fault>(at);
        EXPECT_EQ(Lumod::faultNamed(Lumod::nameOf(fault)), fault);
        EXPECT_STREQ(Wire::textOf(static_cast<int32_t>(Lumod::codeOf(fault))), Lumod::nameOf(fault));
    }
    for (std::size_t at = 0; at < Lumod::operationCount; ++at) {
        auto const operation = static_cast<Operation>(at);
        EXPECT_EQ(Lumod::operationNamed(Lumod::nameOf(operation)), operation);
    }
}

} // namespace
