// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace OrkaConformance {

enum class ExitStatus : int {
    AllPassed = 0,
    SomeFailed = 1,
    Usage = 2,
    NotReachable = 3,
    OutputFailed = 4,
    Interrupted = 130
};

enum class Format { Text, Json, Junit, Markdown };
enum class Action { Run, ListCases, ListBugs, Help };

struct Options {
    Action action = Action::Run;
    std::string url;
    Format format = Format::Text;
    std::string outputPath;        ///< empty: standard output
    std::vector<std::string> only; ///< patterns; none: every case
    uint64_t seed = 1;
    int64_t timeoutMs = 10000;
    std::string bug;          ///< empty: none
    std::string certificates; ///< directory of pinned certificates; empty: none are pinned
};

/// What is wrong with the words on the command line.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// @param words without the program's name. @throws UsageError
Options parseOptions(std::vector<std::string> const &words);

/// Whether a case's name is chosen by the patterns; without patterns, every one is.
bool isChosen(Options const &options, std::string const &name);

char const *usageText();

} // namespace OrkaConformance
