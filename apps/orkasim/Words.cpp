// SPDX-License-Identifier: Apache-2.0
#include "Words.h"

#include <algorithm>
#include <charconv>

namespace Orkasim {

SortedWords::SortedWords(Words const &words, Words const &known, Words const &valued) {
    auto const isIn = [](Words const &list, std::string const &word) {
        return std::find(list.begin(), list.end(), word) != list.end();
    };
    bool flagsEnded = false;
    for (auto word = words.begin(); word != words.end(); ++word) {
        auto const name = word->substr(0, word->find('='));
        // A lone "-" is a name: standard input.
        if (flagsEnded || word->size() < 2 || word->front() != '-') {
            rest_.push_back(*word);
        } else if (*word == "--") {
            flagsEnded = true;
        } else if (isIn(known, *word)) {
            flags_.push_back(*word);
        } else if (isIn(valued, name)) {
            bool const isApart = name.size() == word->size();
            if (isApart && std::next(word) == words.end()) {
                throw UsageError(name + " needs a value");
            }
            auto const &value = isApart ? *++word : word->substr(name.size() + 1);
            if (!values_.emplace(name, value).second) {
                throw UsageError(name + " stands there twice");
            }
        } else {
            throw UsageError("there is no option '" + *word + "'");
        }
    }
}

std::optional<std::string> SortedWords::value(std::string_view option) const {
    auto const found = values_.find(option);
    return found == values_.end() ? std::nullopt : std::optional(found->second);
}

std::optional<int64_t> SortedWords::number(std::string_view option, int64_t least, int64_t most) const {
    auto const text = value(option);
    if (!text) {
        return std::nullopt;
    }
    int64_t number = 0;
    auto const *const end = text->data() + text->size();
    auto const read = std::from_chars(text->data(), end, number);
    if (read.ec != std::errc() || read.ptr != end || number < least || number > most) {
        throw UsageError(std::string(option) + " is a whole number from " + std::to_string(least) + " to " +
                         std::to_string(most) + ", not '" + *text + "'");
    }
    return number;
}

bool SortedWords::has(std::string_view flag) const {
    return std::find(flags_.begin(), flags_.end(), flag) != flags_.end();
}

Words const &SortedWords::named(Words const &names) const {
    if (rest_.size() < names.size()) {
        throw UsageError(names[rest_.size()] + " is missing");
    }
    if (rest_.size() > names.size()) {
        throw UsageError("'" + rest_[names.size()] + "' is one word too many");
    }
    return rest_;
}

} // namespace Orkasim
