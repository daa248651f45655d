// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace Plexa {

/// A mistake in the command line. The sentence is ready to be shown: what came from outside is escaped in it.
class UsageError : public std::exception {
public:
    explicit UsageError(std::string sentence)
        : sentence_(std::move(sentence)) {}
    std::string const &sentence() const noexcept {
        return sentence_;
    }
    char const *what() const noexcept override {
        return sentence_.c_str();
    }

private:
    std::string sentence_;
};

/// A word of the user's between single quotes: escaped, and cut when it is too long to be read.
std::string shownWord(std::string_view word);

/// Names that are near a word that was mistyped, the nearest first, at most three.
std::vector<std::string> nearNames(std::string_view word, std::vector<std::string> const &names);

/// "; did you mean 'add' or 'set'?", empty when there is nothing to offer.
std::string didYouMean(std::vector<std::string> const &names);

} // namespace Plexa
