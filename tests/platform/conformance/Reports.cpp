// SPDX-License-Identifier: Apache-2.0
#include <fstream>
#include <iterator>

#include <gtest/gtest.h>
#include <pugixml.hpp>
#include <rapidjson/document.h>

#include "Options.h"
#include "Reports.h"
#include "orka/conformance/Printable.h"

using namespace OrkaConformance;
using namespace Orka::Conformance;

namespace {

Report sampleReport() {
    Report report;
    report.results = {{{"a/b/passes", "It passes."}, Verdict::Passed, "", "", "", 1500 * kj::MICROSECONDS},
                      {{"a/b/fails", "It <fails> & \"quotes\"."}, Verdict::Failed, "a < b", "\"x\\x1b\" & ]]>", "", {}},
                      {{"a/skipped", "It is skipped."}, Verdict::Skipped, "", "", "nothing to try it on", {}}};
    report.leftBehind = {"the volume \"u\" could not be removed"};
    return report;
}

RunFacts const facts{"file:///a&b", 7};

/// What stands in the document between a pair of markers.
std::string tableIn(std::string const &name) {
    std::ifstream file(TOVI_CONFORMANCE_MD, std::ios::binary);
    std::string const text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    std::string const opening = "<!-- " + name + " -->\n";
    auto const begin = text.find(opening);
    auto const end = text.find("<!-- end of " + name + " -->");
    if (begin == std::string::npos || end == std::string::npos) {
        return "no table of " + name;
    }
    auto table = text.substr(begin + opening.size(), end - begin - opening.size());
    // Heading and rule.
    for (int line = 0; line < 2; ++line) {
        table.erase(0, table.find('\n') + 1);
    }
    return table;
}

} // namespace

TEST(ConformanceDocument, tellsEveryCase) {
    EXPECT_EQ(tableIn("cases"), caseList(Format::Markdown));
}

TEST(ConformanceDocument, tellsEveryBug) {
    EXPECT_EQ(tableIn("bugs"), bugList(Format::Markdown));
}

TEST(ConformanceReports, tellInTextWhatWasExpectedAndWhatCame) {
    auto const report = sampleReport();
    EXPECT_EQ(textOf(report.results[0]), "passed   a/b/passes\n");
    EXPECT_EQ(textOf(report.results[1]), "FAILED   a/b/fails: It <fails> & \"quotes\".\n"
                                         "         expected a < b\n"
                                         "         came     \"x\\x1b\" & ]]>\n");
    EXPECT_EQ(textOf(report.results[2]), "skipped  a/skipped: nothing to try it on\n");
    EXPECT_EQ(textSummary(report), "LEFT     the volume \"u\" could not be removed\n"
                                   "3 cases: 1 passed, 1 failed, 1 skipped\n");
}

TEST(ConformanceReports, areOneJsonDocument) {
    rapidjson::Document document;
    document.Parse(jsonReport(facts, sampleReport()).c_str());
    ASSERT_FALSE(document.HasParseError());
    EXPECT_STREQ(document["provider"].GetString(), "file:///a&b");
    EXPECT_EQ(document["seed"].GetUint64(), 7U);
    EXPECT_EQ(document["passed"].GetUint64(), 1U);
    EXPECT_EQ(document["failed"].GetUint64(), 1U);
    EXPECT_EQ(document["skipped"].GetUint64(), 1U);
    EXPECT_EQ(document["leftBehind"].Size(), 1U);
    auto const &failed = document["cases"][1];
    EXPECT_STREQ(failed["verdict"].GetString(), "failed");
    EXPECT_STREQ(failed["came"].GetString(), "\"x\\x1b\" & ]]>");
    EXPECT_DOUBLE_EQ(document["cases"][0]["seconds"].GetDouble(), 0.0015);
    EXPECT_STREQ(document["cases"][2]["reason"].GetString(), "nothing to try it on");
}

TEST(ConformanceReports, areOneJunitDocument) {
    pugi::xml_document document;
    auto const parsed = document.load_string(junitReport(facts, sampleReport()).c_str());
    ASSERT_TRUE(parsed) << parsed.description();
    auto const suite = document.child("testsuites").child("testsuite");
    EXPECT_EQ(suite.attribute("tests").as_int(), 3);
    EXPECT_EQ(suite.attribute("failures").as_int(), 1);
    EXPECT_EQ(suite.attribute("skipped").as_int(), 1);
    EXPECT_EQ(suite.attribute("errors").as_int(), 1);
    auto const failed = suite.find_child_by_attribute("testcase", "name", "fails");
    EXPECT_STREQ(failed.attribute("classname").value(), "a.b");
    EXPECT_STREQ(failed.child("failure").attribute("message").value(), "expected a < b");
    EXPECT_NE(std::string(failed.child("failure").text().get()).find("came: \"x\\x1b\" & ]]>"), std::string::npos);
    EXPECT_STREQ(
        suite.find_child_by_attribute("testcase", "name", "skipped").child("skipped").attribute("message").value(),
        "nothing to try it on");
}

TEST(ConformanceReports, makeAnyTextHarmless) {
    EXPECT_EQ(printable("plain \xc3\xbc \xf0\x9f\x98\x80"), "plain \xc3\xbc \xf0\x9f\x98\x80");
    EXPECT_EQ(printable(std::string("\x1b[2J\r\n\0\x7f\\", 9)), "\\x1b[2J\\x0d\\x0a\\x00\\x7f\\x5c");
    EXPECT_EQ(printable("\xff\xc0\xaf\xed\xa0\x80\xe2\x82"), "\\xff\\xc0\\xaf\\xed\\xa0\\x80\\xe2\\x82");
    EXPECT_EQ(printable("\xc2\x9b\xe2\x80\xae\xef\xbf\xbf"), "\\xc2\\x9b\\xe2\\x80\\xae\\xef\\xbf\\xbf");
}

TEST(ConformanceOptions, takeValuesAsTheNextWordOrBehindAnEqualsSign) {
    auto const options = parseOptions({"--only", "a/*", "--only=b/*", "--seed=9", "--timeout", "500ms", "file:///x"});
    EXPECT_EQ(options.only, (std::vector<std::string>{"a/*", "b/*"}));
    EXPECT_EQ(options.seed, 9U);
    EXPECT_EQ(options.timeoutMs, 500);
    EXPECT_EQ(options.url, "file:///x");
    EXPECT_EQ(parseOptions({"--timeout=3", "u"}).timeoutMs, 3000);
    EXPECT_EQ(parseOptions({"--", "-u"}).url, "-u");
    EXPECT_TRUE(isChosen(options, "a/x/y"));
    EXPECT_FALSE(isChosen(options, "c/a/x"));
}

TEST(ConformanceOptions, refuseWhatMakesNoSense) {
    std::vector<std::vector<std::string>> const wrong{{},
                                                      {"--nope", "u"},
                                                      {"u", "v"},
                                                      {"--seed"},
                                                      {"--seed", "-1", "u"},
                                                      {"--seed", "18446744073709551616", "u"},
                                                      {"--timeout", "0", "u"},
                                                      {"--timeout", "5m", "u"},
                                                      {"--timeout", "", "u"},
                                                      {"--timeout", "99999999999999999999s", "u"},
                                                      {"--format", "yaml", "u"},
                                                      {"--format", "markdown", "u"},
                                                      {"--list", "--format", "json"}};
    for (auto const &words : wrong) {
        EXPECT_THROW(parseOptions(words), UsageError) << (words.empty() ? "no words" : words[0]);
    }
}
