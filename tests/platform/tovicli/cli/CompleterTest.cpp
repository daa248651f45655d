// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "SampleTree.h"
#include "completion/Completer.h"

namespace {

using namespace Plexa;
using namespace Tovicli::Cli;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;
using Words = std::vector<std::string>;

class Completing : public ::testing::Test {
protected:
    Completing() {
        InputSpecPtr const spec = declareParameters({
            {"vp-name", CallSpec::String, true, "A provider"},
            {"isactive", CallSpec::Bool, false, ""},
            {"arrayid", CallSpec::StringList, false, ""},
            {"force", CallSpec::Flag, false, ""},
            {"size", CallSpec::Int, false, ""},
            {"policy-file", CallSpec::String, false, ""},
        });
        spec->GetParameters()[0]->SetAlias("v");
        hang(root, {"storage", "sample", "set"}, boost::make_shared<DeclaringCommand>(spec));
        hang(root, {"storage", "sample", "settle"}, boost::make_shared<DeclaringCommand>(declareParameters({})));
        auto const describe = boost::make_shared<DeclaringCommand>(declareParameters({
            {"path", CallSpec::StringList, false, ""},
        }));
        describe->SetMetaDataField("positional", "path");
        hang(root, {"cli", "describe"}, describe);
    }

    Words values(Words const &words, std::string const &current) {
        LiveQuery query;
        query.root = "/default";
        last = complete(
            root, query,
            [this](LiveQuery const &asked) {
                queries.push_back(asked);
                return std::vector<Candidate>{{"lab"}, {"larch"}, {"oak"}};
            },
            words, current);
        Words values;
        for (Candidate const &candidate : last.candidates) {
            values.push_back(candidate.value);
        }
        return values;
    }

    boost::shared_ptr<AutoCli::Namespace> root = AutoCli::Namespace::New();
    std::vector<LiveQuery> queries;
    Completion last;
};

TEST_F(Completing, NamesOfNamespacesAndCommands) {
    EXPECT_THAT(values({}, ""), ElementsAre("storage", "cli"));
    EXPECT_THAT(values({}, "st"), ElementsAre("storage"));
    EXPECT_THAT(values({"storage", "sample"}, "se"), ElementsAre("set", "settle"));
    EXPECT_THAT(values({"nowhere"}, ""), IsEmpty());
}

TEST_F(Completing, OptionsOfTheCommandAndOfTheTool) {
    EXPECT_THAT(values({"storage", "sample", "set"}, "--v"), ElementsAre("--vp-name", "--version"));
    EXPECT_THAT(values({"storage", "sample", "set"}, ""),
                ElementsAre("--vp-name", "--isactive", "--arrayid", "--force", "--size", "--policy-file"));
    EXPECT_THAT(values({}, "--fo"), ElementsAre("--format", "--format-param"));
}

TEST_F(Completing, OptionsThatStandThereAlreadyAreNotOfferedAgainUnlessTheyAreLists) {
    Words const offered = values({"storage", "sample", "set", "-v", "x", "--arrayid", "a", "--force"}, "--");
    EXPECT_THAT(offered, Not(Contains("--vp-name")));
    EXPECT_THAT(offered, Not(Contains("--force")));
    EXPECT_THAT(offered, Contains("--arrayid"));
}

TEST_F(Completing, ValuesBehindAnOptionHoweverItIsWritten) {
    EXPECT_THAT(values({"storage", "sample", "set", "--vp-name"}, "l"), ElementsAre("lab", "larch"));
    EXPECT_THAT(values({"storage", "sample", "set", "-v"}, "o"), ElementsAre("oak"));
    EXPECT_THAT(values({"storage", "sample", "set"}, "--vp-name=la"), ElementsAre("lab", "larch"));
    EXPECT_EQ(last.before, "--vp-name=");
    EXPECT_THAT(values({"storage", "sample", "set", "--isactive"}, ""), ElementsAre("true", "false"));
    EXPECT_THAT(values({"storage", "sample", "set", "--size"}, ""), IsEmpty());
    EXPECT_THAT(values({"--format"}, "j"), ElementsAre("json"));
}

TEST_F(Completing, AValueThatLooksLikeAnOptionIsAValue) {
    EXPECT_THAT(values({"storage", "sample", "set", "--size", "-1", "--isactive"}, "t"), ElementsAre("true"));
    EXPECT_THAT(values({"storage", "sample", "set", "--vp-name"}, "--v"), IsEmpty());
}

TEST_F(Completing, FilesAndDirectoriesAreLeftToTheShell) {
    values({"storage", "sample", "set", "--policy-file"}, "x");
    EXPECT_EQ(last.kind, Completion::Kind::Files);
    values({"--root"}, "");
    EXPECT_EQ(last.kind, Completion::Kind::Directories);
}

TEST_F(Completing, LiveValuesAreThoseOfTheRootThatTheLineNames) {
    values({"--root", "/elsewhere", "storage", "sample", "set", "-v"}, "");
    values({"storage", "sample", "set", "-v"}, "");
    ASSERT_EQ(queries.size(), 2U);
    EXPECT_EQ(queries[0].root, "/elsewhere");
    EXPECT_EQ(queries[1].root, "/default");
}

TEST_F(Completing, WordsOfAPathForACommandThatTakesOne) {
    EXPECT_THAT(values({"cli", "describe"}, ""), ElementsAre("storage", "cli"));
    EXPECT_THAT(values({"cli", "describe", "storage", "sample"}, "sett"), ElementsAre("settle"));
    EXPECT_THAT(values({"cli", "describe", "nowhere"}, ""), IsEmpty());
}

} // namespace
