// SPDX-License-Identifier: Apache-2.0
//
// The kit on the embedded provider, and what becomes of what it makes.
#include "Fixture.h"

#include <algorithm>
#include <regex>
#include <set>

#include "conformance/bugs/Forwarding.h"
#include "orka/ProviderFactory.h"

using namespace Orka::Conformance;

namespace {

using RunningTheKit = ConformanceTest;

/// Lets nobody delete.
class KeepsEverything final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Orka::Done> deleteVirtualVolume(Orka::CallContext, std::string, std::string) override {
        return Orka::Outcome<Orka::Done>(Wire::Failure(Wire::ErrorCode::IoError, "stuck\x1b[2J"));
    }
};

/// Never answers a making.
class NeverMakes final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Orka::VirtualVolume> createVirtualVolume(Orka::CallContext, Orka::VolumeSpec) override {
        return kj::NEVER_DONE;
    }
};

template <typename Decorator>
Surroundings decorated(Surroundings surroundings) {
    auto &timer = surroundings.timer;
    surroundings.connect = [connect = surroundings.connect, &timer] {
        return std::make_unique<Decorator>(connect(), timer);
    };
    return surroundings;
}

} // namespace

TEST_F(RunningTheKit, findsNothingWrongWithTheEmbeddedProvider) {
    auto const before = counts();
    auto const report = run(surroundings());
    EXPECT_EQ(notPassed(report), "");
    EXPECT_GE(report.count(Verdict::Passed), 120U);
    EXPECT_EQ(report.results.size(), caseTitles().size());
    EXPECT_TRUE(report.leftBehind.empty());
    EXPECT_EQ(counts(), before);
}

TEST_F(RunningTheKit, findsNothingWrongWithAnotherSeed) {
    auto with = surroundings();
    with.seed = 7;
    EXPECT_EQ(notPassed(run(with, {"c"})), "");
}

TEST_F(RunningTheKit, givesEachCaseANameOfItsOwnAndASentence) {
    std::regex const name("[a-z0-9-]+(/[a-z0-9-]+)+");
    std::regex const sentence("[A-Z0-9].*\\.");
    std::set<std::string> seen;
    for (auto const &title : caseTitles()) {
        EXPECT_TRUE(std::regex_match(title.name, name)) << title.name;
        EXPECT_TRUE(std::regex_match(title.demand, sentence)) << title.demand;
        EXPECT_TRUE(seen.insert(title.name).second) << title.name;
    }
    EXPECT_GE(seen.size(), 120U);
}

TEST_F(RunningTheKit, skipsWhatTheArrayHasNothingFor) {
    makeArray(R"({"arrays": [{"id": "a", "endpoints": [{"uid": "pe", "type": "SCSI"}]}], "containers":
                 [{"id": "00000000-0000-4000-8000-00000000000a", "name": "c", "maxLumoSizeMb": 10, "arrays": ["a"]}]})");
    auto const report = run(surroundings(), {"volume/"});
    std::set<std::string> skipped;
    for (auto const &result : report.results) {
        if (result.verdict == Verdict::Skipped) {
            skipped.insert(result.title.name + ": " + result.reason);
        }
    }
    EXPECT_EQ(report.count(Verdict::Failed), 0U) << notPassed(report);
    EXPECT_EQ(skipped.count("volume/create/name-elsewhere: the provider exports one storage container only"), 1U);
    EXPECT_EQ(skipped.count("volume/bind/endpoint-inaccessible: every protocol endpoint of the storage container is "
                            "accessible"),
              1U);
    EXPECT_EQ(skipped.count("volume/bind/other-endpoint: no storage container has two protocol endpoints that can be "
                            "bound to"),
              1U);
}

TEST_F(RunningTheKit, skipsAllOfAnArrayWithoutContainers) {
    makeArray(R"({"arrays": [{"id": "a"}]})");
    auto const report = run(surroundings(), {"volume/"});
    EXPECT_EQ(report.count(Verdict::Skipped), report.results.size());
}

TEST_F(RunningTheKit, tellsWhyAProviderIsOfNoUse) {
    auto with = surroundings();
    with.connect = [this] {
        return Orka::makeProvider("file://" + at("missing.array"), {io_.provider->getTimer(), nullptr});
    };
    Kit kit(with);
    auto const failure = kit.reach();
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->sentence(), "the array file '" + at("missing.array") + "' does not exist");
}

TEST_F(RunningTheKit, removesWhatAFailedCaseMade) {
    auto const before = counts();
    std::vector<std::pair<char const *, char const *>> const tried{{"looks-then-makes", "concurrency/"},
                                                                   {"ignores-bind-keys", "idempotency/"},
                                                                   {"cuts-names", "hostile/name/"},
                                                                   {"remembers-after-answer", "cut/create/"}};
    for (auto const &[bug, cases] : tried) {
        auto const report = run(surroundings(bug), {cases});
        EXPECT_GE(report.count(Verdict::Failed), 1U) << bug;
        EXPECT_TRUE(report.leftBehind.empty()) << bug;
        EXPECT_EQ(counts(), before) << bug;
    }
}

TEST_F(RunningTheKit, namesWhatCannotBeRemoved) {
    auto const report = run(decorated<KeepsEverything>(surroundings()), {"volume/create/facts"});
    ASSERT_EQ(report.leftBehind.size(), 1U);
    EXPECT_NE(report.leftBehind[0].find("could not be removed: failure 47 (input/output error): \"stuck\\x1b[2J\""),
              std::string::npos)
        << report.leftBehind[0];
}

TEST_F(RunningTheKit, seesTheResidueOfWhatCannotBeRemoved) {
    auto const report = run(decorated<KeepsEverything>(surroundings()), {"volume/create/facts", "residue/volumes"});
    ASSERT_EQ(report.results.size(), 2U);
    EXPECT_EQ(report.results[0].verdict, Verdict::Passed);
    EXPECT_EQ(report.results[1].verdict, Verdict::Failed);
}

TEST_F(RunningTheKit, goesOnAfterAnAnswerThatNeverComes) {
    auto with = decorated<NeverMakes>(surroundings());
    with.timeout = 20 * kj::MILLISECONDS;
    auto const report = run(with, {"volume/create/size-one", "volume/query/facts"});
    EXPECT_EQ(report.count(Verdict::Failed), 2U);
    EXPECT_EQ(report.results[0].expected, "an answer by the deadline");
    EXPECT_EQ(report.results[0].came, "none a second after it");
}

TEST_F(RunningTheKit, endsEarlyWhenItIsInterruptedAndLeavesNothing) {
    auto const before = counts();
    auto ended = kj::newPromiseAndFulfiller<void>();
    auto fork = ended.promise.fork();
    auto with = surroundings();
    with.interruption = [&fork] { return fork.addBranch(); };
    int made = 0;
    with.connect = [this, &made, &ended] {
        // In the middle of a case that makes volumes: each begins with a connection of its own.
        if (++made == 40) {
            ended.fulfiller->fulfill();
        }
        return connect();
    };
    auto const report = run(with);
    EXPECT_TRUE(report.interrupted);
    EXPECT_LT(report.results.size(), caseTitles().size());
    EXPECT_GT(report.results.size(), 5U);
    EXPECT_EQ(report.results.back().reason, "interrupted");
    EXPECT_TRUE(report.leftBehind.empty());
    EXPECT_EQ(counts(), before);
}
