// SPDX-License-Identifier: Apache-2.0
//
// A line as a POSIX shell splits it into words: quotes, backslashes, comments. Nothing is expanded: what a shell would
// make something else of (variables, pipes, redirections, several commands) is a mistake that is told, not a text that
// means something different here.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Tovicli::Cli {

/// @throws Plexa::UsageError for a quote that is not closed and for what only a shell does
std::vector<std::string> splitWords(std::string_view line);

/// The beginning of a line, up to where a word is being completed.
struct Unfinished {
    std::vector<std::string> words; ///< those before the last one
    std::string current;            ///< the last one without its quotes; empty behind a blank
    std::size_t begin = 0;          ///< where it begins in the line
};

/// Takes any line: a quote may be open, what only a shell does is text.
Unfinished splitUnfinished(std::string_view line);

/// A word as it can be typed: quoted where it has to be.
std::string quotedWord(std::string const &word);

} // namespace Tovicli::Cli
