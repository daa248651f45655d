// SPDX-License-Identifier: Apache-2.0
//
// Lines that a user types into `cli shell`, and beginnings of lines whose completion he asks for.
#include <string>
#include <vector>

#include "Property.h"
#include "plexa/UsageError.h"
#include "shell/Words.h"

namespace {

using Fuzz::require;
using namespace Tovicli::Cli;

std::string lineOf(std::vector<std::string> const &words) {
    std::string line;
    for (std::string const &word : words) {
        line += (line.empty() ? "" : " ") + quotedWord(word);
    }
    return line;
}

void checkUnfinished(std::string_view line) {
    Unfinished const found = splitUnfinished(line);
    require(found.begin <= line.size(), "a word begins in the line");
    std::size_t bytes = found.current.size();
    for (std::string const &word : found.words) {
        bytes += word.size();
    }
    require(bytes <= line.size(), "splitting adds nothing");
    if (found.begin == line.size()) {
        require(found.current.empty(), "a word that begins at the end is empty", found.current);
    }
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    std::string_view const line = Fuzz::textOf(data, size);
    checkUnfinished(line);
    // As one word, whatever it is.
    std::string const whole(line);
    require(splitWords(quotedWord(whole)) == std::vector<std::string>{whole}, "a quoted word is itself", whole);
    std::vector<std::string> words;
    try {
        words = splitWords(line);
    } catch (Plexa::UsageError const &mistake) {
        Fuzz::requireSentence(mistake.sentence());
        return 0;
    }
    std::string const again = lineOf(words);
    require(splitWords(again) == words, "words quoted and split again are the same", again);
    // What is whole is also what completion sees, once a blank has ended the last word and nothing is a comment.
    if (line.find('#') == std::string_view::npos) {
        Unfinished const ended = splitUnfinished(whole + " ");
        require(ended.words == words, "completion splits a whole line as execution does", whole);
    }
    return 0;
}
