// SPDX-License-Identifier: Apache-2.0
#include "Words.h"

#include <algorithm>

namespace Orkasim {

SortedWords::SortedWords(Words const &words, Words const &known) {
    bool flagsEnded = false;
    for (auto const &word : words) {
        // A lone "-" is a name: standard input.
        if (flagsEnded || word.size() < 2 || word.front() != '-') {
            rest_.push_back(word);
        } else if (word == "--") {
            flagsEnded = true;
        } else if (std::find(known.begin(), known.end(), word) != known.end()) {
            flags_.push_back(word);
        } else {
            throw UsageError("there is no option '" + word + "'");
        }
    }
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
