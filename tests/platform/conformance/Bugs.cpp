// SPDX-License-Identifier: Apache-2.0
//
// Every bug is found by the case that is there to find it.
#include "Fixture.h"

#include <ostream>
#include <set>

#include "orka/conformance/Bugs.h"

namespace Orka::Conformance {

/// What a failed test calls it.
void PrintTo(Bug const &bug, std::ostream *stream) {
    *stream << bug.name;
}

} // namespace Orka::Conformance

using namespace Orka::Conformance;

namespace {

class ABug : public ConformanceTest, public ::testing::WithParamInterface<Bug> {};

std::string nameOf(::testing::TestParamInfo<Bug> const &info) {
    std::string name = info.param.name;
    for (auto &character : name) {
        character = character == '-' ? '_' : character;
    }
    return name;
}

} // namespace

TEST_P(ABug, isFoundByItsCaseAndNothingStays) {
    auto const before = counts();
    auto const found = run(surroundings(GetParam().name), {GetParam().caughtBy});
    ASSERT_GE(found.results.size(), 1U) << "there is no case " << GetParam().caughtBy;
    EXPECT_EQ(found.results[0].title.name, GetParam().caughtBy);
    EXPECT_EQ(found.results[0].verdict, Verdict::Failed);
    EXPECT_FALSE(found.results[0].expected.empty());
    EXPECT_FALSE(found.results[0].came.empty());
    EXPECT_EQ(counts(), before);
    auto const right = run(surroundings(), {GetParam().caughtBy});
    EXPECT_EQ(notPassed(right), "");
}

INSTANTIATE_TEST_SUITE_P(, ABug, ::testing::ValuesIn(bugs()), nameOf);

TEST(TheBugs, areTwentyOrMoreWithNamesOfTheirOwn) {
    std::set<std::string> names;
    for (auto const &bug : bugs()) {
        EXPECT_TRUE(names.insert(bug.name).second) << bug.name;
    }
    EXPECT_GE(names.size(), 20U);
}

TEST_F(ConformanceTest, ABugOfNoKnownNameIsRefused) {
    try {
        makeBuggy("none", connect(), io_.provider->getTimer());
        FAIL() << "it was not refused";
    } catch (Wire::Failure const &failure) {
        EXPECT_EQ(failure.code(), Wire::ErrorCode::InvalidArgument);
        EXPECT_EQ(failure.sentence(), "there is no bug 'none'");
    }
}
