// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "Commands.h"

namespace Orkasim {

/// A command's words sorted into flags, options with a value, and the rest. "--" ends flags and options.
class SortedWords {
public:
    /// @throws UsageError for a flag that is not among `known`, an option of `valued` that comes twice or without a
    /// value
    SortedWords(Words const &words, Words const &known, Words const &valued = {});

    bool has(std::string_view flag) const;
    /// What follows an option, as --name VALUE or --name=VALUE.
    std::optional<std::string> value(std::string_view option) const;
    /// A whole number. @throws UsageError when it is none, or out of range
    std::optional<int64_t> number(std::string_view option, int64_t least, int64_t most) const;
    /// The words that are no flags. @throws UsageError when there are not as many as there are names
    Words const &named(Words const &names) const;

private:
    Words flags_;
    std::map<std::string, std::string, std::less<>> values_;
    Words rest_;
};

} // namespace Orkasim
