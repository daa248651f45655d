// SPDX-License-Identifier: Apache-2.0
#include "plexa/Display.h"

#include <charconv>

namespace Plexa {

namespace {

/// 0 for a text that is no width.
std::size_t widthFrom(std::string const &text) {
    constexpr std::size_t widest = 10000;
    std::size_t width = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), width);
    bool const whole = error == std::errc() && end == text.data() + text.size();
    return whole && width <= widest ? width : 0;
}

} // namespace

Display displayOf(bool isTerminal, std::size_t columns, Variables const &variables) {
    Display display;
    if (!isTerminal) {
        return display;
    }
    std::size_t const asked = widthFrom(variables("COLUMNS").value_or(""));
    display.width = asked != 0 ? asked : columns;
    std::string const terminal = variables("TERM").value_or("");
    display.plain = terminal.empty() || terminal == "dumb";
    display.colour = !display.plain && variables("NO_COLOR").value_or("").empty();
    return display;
}

} // namespace Plexa
