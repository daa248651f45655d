// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "plexa/SentenceError.h"

namespace Plexa {

/// A mistake in the command line.
class UsageError : public SentenceError {
public:
    using SentenceError::SentenceError;
};

/// A word of the user's between single quotes: escaped, and cut when it is too long to be read.
std::string shownWord(std::string_view word);

/// Names that are near a word that was mistyped, the nearest first, at most three.
std::vector<std::string> nearNames(std::string_view word, std::vector<std::string> const &names);

/// "; did you mean 'add' or 'set'?", empty when there is nothing to offer.
std::string didYouMean(std::vector<std::string> const &names);

} // namespace Plexa
