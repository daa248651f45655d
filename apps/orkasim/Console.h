// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iosfwd>
#include <string>
#include <string_view>

namespace Orkasim {

/// Where a command reads and writes; main's are the standard streams.
struct Console {
    std::istream &in;
    std::ostream &out;
    std::ostream &err;
};

/// As the command-line tool's.
enum class ExitStatus : int { Done = 0, Failed = 1, Usage = 2, OutputFailed = 4 };

/// A text that a terminal shows instead of obeying: control characters become \x1b and the like.
std::string printable(std::string_view text);

} // namespace Orkasim
