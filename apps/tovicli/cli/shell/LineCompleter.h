// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "shell/LineSource.h"

namespace Tovicli::Cli {

/// What `cli complete` answered: its first line, and values with descriptions.
struct Answer {
    std::string kind;
    std::vector<std::pair<std::string, std::string>> values;
};

/// Asks this program, in a process of its own, as any shell does: a daemon that is slow to answer costs a second at
/// most and nothing of this process's session.
Answer askProgram(std::vector<std::string> const &words, std::string const &current);

/// What to do with an answer, as pressing Tab once does it.
LineCompletion
lineCompletion(std::string const &upToCursor,
               std::function<Answer(std::vector<std::string> const &words, std::string const &current)> const &ask);

} // namespace Tovicli::Cli
