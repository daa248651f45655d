// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

#include "Commands.h"

namespace Orkasim {

/// A command's words sorted into flags and the rest. "--" ends the flags.
class SortedWords {
public:
    /// @throws UsageError for a flag that is not among `known`
    SortedWords(Words const &words, Words const &known);

    bool has(std::string_view flag) const;
    /// The words that are no flags. @throws UsageError when there are not as many as there are names
    Words const &named(Words const &names) const;

private:
    Words flags_;
    Words rest_;
};

} // namespace Orkasim
