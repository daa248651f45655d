// SPDX-License-Identifier: Apache-2.0
#include "plexa/UsageError.h"

#include <algorithm>
#include <cctype>

#include "plexa/Text.h"

namespace Plexa {

namespace {

char lower(char c) {
    return static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
}

/// How many letters must be changed, added, left out or swapped with a neighbour to get from one word to the other.
std::size_t editDistance(std::string_view left, std::string_view right) {
    std::vector<std::size_t> beforeLast(right.size() + 1);
    std::vector<std::size_t> last(right.size() + 1);
    std::vector<std::size_t> row(right.size() + 1);
    for (std::size_t column = 0; column <= right.size(); ++column) {
        row[column] = column;
    }
    for (std::size_t i = 1; i <= left.size(); ++i) {
        beforeLast.swap(last);
        last.swap(row);
        row[0] = i;
        for (std::size_t j = 1; j <= right.size(); ++j) {
            bool const same = lower(left[i - 1]) == lower(right[j - 1]);
            row[j] = std::min({last[j] + 1, row[j - 1] + 1, last[j - 1] + (same ? 0U : 1U)});
            bool const swapped = i > 1 && j > 1 && lower(left[i - 1]) == lower(right[j - 2]) &&
                                 lower(left[i - 2]) == lower(right[j - 1]);
            if (swapped) {
                row[j] = std::min(row[j], beforeLast[j - 2] + 1);
            }
        }
    }
    return row[right.size()];
}

bool beginsWith(std::string_view text, std::string_view beginning) {
    return text.size() >= beginning.size() &&
           std::equal(beginning.begin(), beginning.end(), text.begin(),
                      [](char left, char right) { return lower(left) == lower(right); });
}

} // namespace

std::string shownWord(std::string_view word) {
    constexpr std::size_t longest = 120; // bytes; more of it would bury the sentence it stands in
    if (word.size() <= longest) {
        return "'" + escaped(word) + "'";
    }
    std::string_view rest = word;
    while (word.size() - rest.size() < longest) {
        takeCharacter(rest);
    }
    return "'" + escaped(word.substr(0, word.size() - rest.size())) + "...' (" + std::to_string(word.size()) +
           " bytes)";
}

std::vector<std::string> nearNames(std::string_view word, std::vector<std::string> const &names) {
    constexpr std::size_t most = 3;
    constexpr std::size_t longest = 64; // no name of ours is longer; comparing costs the product of both lengths
    if (word.empty() || word.size() > longest) {
        return {};
    }
    std::size_t const farthest = std::max<std::size_t>(1, word.size() / 3);
    std::vector<std::pair<std::size_t, std::string>> near;
    for (std::string const &name : names) {
        std::size_t const distance = beginsWith(name, word) && word.size() > 1 ? 0 : editDistance(word, name);
        if (distance <= farthest) {
            near.emplace_back(distance, name);
        }
    }
    std::stable_sort(near.begin(), near.end(),
                     [](auto const &left, auto const &right) { return left.first < right.first; });
    std::vector<std::string> nearest;
    for (std::size_t i = 0; i < near.size() && i < most; ++i) {
        nearest.push_back(near[i].second);
    }
    return nearest;
}

std::string didYouMean(std::vector<std::string> const &names) {
    std::string text;
    for (std::size_t i = 0; i < names.size(); ++i) {
        text += i == 0 ? "; did you mean " : (i + 1 == names.size() ? " or " : ", ");
        text += shownWord(names[i]);
    }
    return text.empty() ? text : text + "?";
}

} // namespace Plexa
