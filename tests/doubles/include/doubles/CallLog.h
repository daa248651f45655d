// SPDX-License-Identifier: Apache-2.0
//
// What a command did, in order: one line a call, over every double that shares the log. A line reads like the call:
//     LumoLib_Init(0, 0)
//     StorageInfoImpl.LumoVpExists("north")
#pragma once

#include <string>
#include <type_traits>
#include <vector>

namespace Doubles {

/// A text that goes into a line as it stands, without quotes.
struct Verbatim {
    std::string text;
};

/// Quotes a text; line ends, tabs, quotes and backslashes inside it are escaped, so that no two texts print alike.
std::string quoted(std::string const &text);

class CallLog {
public:
    /// Adds the line `name(argument, ...)`.
    template <class... Arguments>
    void call(std::string const &name, Arguments const &...arguments) {
        std::string line = name + "(";
        [[maybe_unused]] char const *separator = "";
        ((line += separator + print(arguments), separator = ", "), ...);
        lines_.push_back(line + ")");
    }

    std::vector<std::string> const &lines() const {
        return lines_;
    }
    /// The lines that begin so, in order.
    std::vector<std::string> linesOf(std::string const &prefix) const;
    /// How many lines begin so.
    std::size_t count(std::string const &prefix) const;
    void clear() {
        lines_.clear();
    }

private:
    static std::string print(bool value) {
        return value ? "true" : "false";
    }
    template <class Number, class = std::enable_if_t<std::is_arithmetic_v<Number>>>
    static std::string print(Number value) {
        return std::to_string(value);
    }
    static std::string print(char const *text) {
        return text == nullptr ? "null" : quoted(text);
    }
    static std::string print(std::string const &text) {
        return quoted(text);
    }
    static std::string print(Verbatim const &verbatim) {
        return verbatim.text;
    }
    static std::string print(std::vector<std::string> const &texts);

    std::vector<std::string> lines_;
};

} // namespace Doubles
