// SPDX-License-Identifier: Apache-2.0
#include "Reports.h"

#include <sstream>

#include <fmt/format.h>
#include <pugixml.hpp>
#include <rapidjson/prettywriter.h>
#include <rapidjson/stringbuffer.h>

#include "orka/conformance/Bugs.h"

namespace OrkaConformance {

using Orka::Conformance::CaseResult;
using Orka::Conformance::Report;
using Orka::Conformance::Verdict;

namespace {

char const *wordOf(Verdict verdict) {
    switch (verdict) {
    case Verdict::Passed:
        return "passed";
    case Verdict::Failed:
        return "failed";
    case Verdict::Skipped:
        return "skipped";
    }
    return "unknown";
}

double seconds(kj::Duration duration) {
    return static_cast<double>(duration / kj::MICROSECONDS) / 1e6;
}

using JsonWriter = rapidjson::PrettyWriter<rapidjson::StringBuffer>;

void member(JsonWriter &writer, char const *name, std::string const &text) {
    writer.Key(name);
    writer.String(text.data(), static_cast<rapidjson::SizeType>(text.size()));
}

void jsonCase(JsonWriter &writer, CaseResult const &result) {
    writer.StartObject();
    member(writer, "name", result.title.name);
    member(writer, "demand", result.title.demand);
    member(writer, "verdict", wordOf(result.verdict));
    if (result.verdict == Verdict::Failed) {
        member(writer, "expected", result.expected);
        member(writer, "came", result.came);
    } else if (result.verdict == Verdict::Skipped) {
        member(writer, "reason", result.reason);
    }
    writer.Key("seconds");
    writer.Double(seconds(result.took));
    writer.EndObject();
}

void junitCase(pugi::xml_node suite, CaseResult const &result) {
    auto node = suite.append_child("testcase");
    auto const slash = result.title.name.rfind('/');
    std::string className = result.title.name.substr(0, slash);
    for (auto &character : className) {
        character = character == '/' ? '.' : character;
    }
    node.append_attribute("classname") = className.c_str();
    node.append_attribute("name") = result.title.name.substr(slash + 1).c_str();
    node.append_attribute("time") = fmt::format("{:.6f}", seconds(result.took)).c_str();
    if (result.verdict == Verdict::Failed) {
        auto failure = node.append_child("failure");
        failure.append_attribute("message") = ("expected " + result.expected).c_str();
        failure.text() =
            fmt::format("{}\nexpected: {}\ncame: {}\n", result.title.demand, result.expected, result.came).c_str();
    } else if (result.verdict == Verdict::Skipped) {
        node.append_child("skipped").append_attribute("message") = result.reason.c_str();
    }
}

/// A cell of a table: "|" would end it.
std::string cell(std::string text) {
    for (size_t at = text.find('|'); at != std::string::npos; at = text.find('|', at + 2)) {
        text.replace(at, 1, "\\|");
    }
    return text;
}

} // namespace

std::string textOf(CaseResult const &result) {
    switch (result.verdict) {
    case Verdict::Passed:
        return "passed   " + result.title.name + '\n';
    case Verdict::Skipped:
        return "skipped  " + result.title.name + ": " + result.reason + '\n';
    case Verdict::Failed:
        break;
    }
    return fmt::format("FAILED   {}: {}\n         expected {}\n         came     {}\n", result.title.name,
                       result.title.demand, result.expected, result.came);
}

std::string textSummary(Report const &report) {
    std::string text;
    for (auto const &sentence : report.leftBehind) {
        text += "LEFT     " + sentence + '\n';
    }
    return text + fmt::format("{}{} cases: {} passed, {} failed, {} skipped\n",
                              report.interrupted ? "interrupted after " : "", report.results.size(),
                              report.count(Verdict::Passed), report.count(Verdict::Failed),
                              report.count(Verdict::Skipped));
}

std::string jsonReport(RunFacts const &facts, Report const &report) {
    rapidjson::StringBuffer buffer;
    JsonWriter writer(buffer);
    writer.SetIndent(' ', 2);
    writer.StartObject();
    member(writer, "provider", facts.url);
    writer.Key("seed");
    writer.Uint64(facts.seed);
    for (auto const verdict : {Verdict::Passed, Verdict::Failed, Verdict::Skipped}) {
        writer.Key(wordOf(verdict));
        writer.Uint64(report.count(verdict));
    }
    writer.Key("interrupted");
    writer.Bool(report.interrupted);
    writer.Key("leftBehind");
    writer.StartArray();
    for (auto const &sentence : report.leftBehind) {
        writer.String(sentence.data(), static_cast<rapidjson::SizeType>(sentence.size()));
    }
    writer.EndArray();
    writer.Key("cases");
    writer.StartArray();
    for (auto const &result : report.results) {
        jsonCase(writer, result);
    }
    writer.EndArray();
    writer.EndObject();
    return std::string(buffer.GetString(), buffer.GetSize()) + '\n';
}

std::string junitReport(RunFacts const &facts, Report const &report) {
    pugi::xml_document document;
    auto declaration = document.append_child(pugi::node_declaration);
    declaration.append_attribute("version") = "1.0";
    declaration.append_attribute("encoding") = "UTF-8";
    auto suite = document.append_child("testsuites").append_child("testsuite");
    auto total = 0 * kj::NANOSECONDS;
    for (auto const &result : report.results) {
        total += result.took;
    }
    suite.append_attribute("name") = "orka-conformance";
    suite.append_attribute("tests") = static_cast<unsigned long long>(report.results.size());
    suite.append_attribute("failures") = static_cast<unsigned long long>(report.count(Verdict::Failed));
    suite.append_attribute("errors") = static_cast<unsigned long long>(report.leftBehind.size());
    suite.append_attribute("skipped") = static_cast<unsigned long long>(report.count(Verdict::Skipped));
    suite.append_attribute("time") = fmt::format("{:.6f}", seconds(total)).c_str();
    auto properties = suite.append_child("properties");
    for (auto const &[name, value] : {std::pair<char const *, std::string>{"provider", facts.url},
                                      std::pair<char const *, std::string>{"seed", std::to_string(facts.seed)}}) {
        auto property = properties.append_child("property");
        property.append_attribute("name") = name;
        property.append_attribute("value") = value.c_str();
    }
    for (auto const &result : report.results) {
        junitCase(suite, result);
    }
    if (!report.leftBehind.empty()) {
        std::string left;
        for (auto const &sentence : report.leftBehind) {
            left += sentence + '\n';
        }
        suite.append_child("system-err").text() = left.c_str();
    }
    std::ostringstream text;
    document.save(text, "  ");
    return text.str();
}

std::string caseList(Format format) {
    std::string text;
    for (auto const &title : Orka::Conformance::caseTitles()) {
        text += format == Format::Markdown ? fmt::format("| `{}` | {} |\n", title.name, cell(title.demand))
                                           : fmt::format("{}\n    {}\n", title.name, title.demand);
    }
    return text;
}

std::string bugList(Format format) {
    std::string text;
    for (auto const &bug : Orka::Conformance::bugs()) {
        std::string const overHttps =
            bug.hiddenOverHttps != nullptr ? fmt::format("no: {}", bug.hiddenOverHttps) : "yes";
        text += format == Format::Markdown ? fmt::format("| `{}` | {} | `{}` | {} |\n", bug.name, cell(bug.description),
                                                         bug.caughtBy, cell(overHttps))
                                           : fmt::format("{}\n    {}\n    found by {}\n    over HTTPS: {}\n", bug.name,
                                                         bug.description, bug.caughtBy, overHttps);
    }
    return text;
}

} // namespace OrkaConformance
