// SPDX-License-Identifier: Apache-2.0
//
// What came of a run, in the formats that people and build servers read. Texts in a report are printable already; only
// the format's own characters are escaped here.
#pragma once

#include <string>

#include "Options.h"
#include "orka/conformance/Kit.h"

namespace OrkaConformance {

/// What a report tells beside its results.
struct RunFacts {
    std::string url;
    uint64_t seed = 0;
};

/// A line for each case that ended, three for one that failed.
std::string textOf(Orka::Conformance::CaseResult const &result);
/// What a text report ends with.
std::string textSummary(Orka::Conformance::Report const &report);
std::string jsonReport(RunFacts const &facts, Orka::Conformance::Report const &report);
std::string junitReport(RunFacts const &facts, Orka::Conformance::Report const &report);

/// Every case, or every bug, as text or as rows of a table.
std::string caseList(Format format);
std::string bugList(Format format);

} // namespace OrkaConformance
