// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>

namespace Plexa {

/// What people read a result on, as far as a format for people asks. The default is no terminal: nothing is broken to a
/// width, and there are no colours.
struct Display {
    /// Columns that tables are laid out to; 0 for no limit.
    std::size_t width = 0;
    bool colour = false;
    /// Draws with ASCII alone.
    bool plain = false;
};

/// Looks a variable of the environment up; nothing when it is not set.
using Variables = std::function<std::optional<std::string>(std::string const &name)>;

/// What a stream leads to. COLUMNS, a whole number from 1 to 10000, counts before the terminal's own width. There is no
/// colour where NO_COLOR is set to anything but an empty text, or where TERM is dumb, empty or not set; on a dumb
/// terminal lines are drawn in ASCII.
/// @param isTerminal whether the stream is a terminal; without one the environment does not count
/// @param columns    of the terminal; 0 when it does not tell
Display displayOf(bool isTerminal, std::size_t columns, Variables const &variables);

} // namespace Plexa
