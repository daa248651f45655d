// SPDX-License-Identifier: Apache-2.0
#include "shell/Words.h"

#include <algorithm>

#include "plexa/UsageError.h"

namespace Tovicli::Cli {

using Plexa::UsageError;

namespace {

constexpr std::string_view blanks = " \t\r\n";
/// What a shell gives a meaning to outside quotes. Patterns and ~ are left: where nothing matches, a shell leaves them
/// too.
constexpr std::string_view shellOnly = "|&;<>()";
constexpr std::string_view expansions = "$`";
constexpr std::string_view escapedInQuotes = "\\\"$`";

/// Reads a line from its beginning to its end, once.
class Splitter {
public:
    Splitter(std::string_view line, bool strict)
        : line_(line)
        , strict_(strict) {}

    Unfinished split() {
        while (at_ < line_.size()) {
            char const c = line_[at_];
            if (blanks.find(c) != std::string_view::npos) {
                endWord();
                ++at_;
            } else if (c == '#' && !inWord_ && strict_) {
                break; // a comment
            } else {
                beginWord();
                takeOne(c);
            }
        }
        if (!inWord_) {
            found_.begin = line_.size();
        }
        return found_;
    }

private:
    void beginWord() {
        if (!inWord_) {
            found_.begin = at_;
            inWord_ = true;
        }
    }
    void endWord() {
        if (inWord_) {
            found_.words.push_back(found_.current);
            found_.current.clear();
            inWord_ = false;
        }
    }
    void take(std::size_t count) {
        found_.current += line_.substr(at_, count);
        at_ += count;
    }
    void refuse(std::string const &sentence) const {
        if (strict_) {
            throw UsageError(sentence);
        }
    }
    void refuseExpansion(char c) const {
        refuse(std::string("'") + c + "' is not expanded here; write \\" + c + " for the character itself");
    }

    void takeOne(char c) {
        if (c == '\'') {
            takeSingleQuoted();
        } else if (c == '"') {
            takeDoubleQuoted();
        } else if (c == '\\') {
            if (at_ + 1 == line_.size()) {
                refuse("the line ends in a backslash; a command stands in one line");
            }
            ++at_;
            take(1);
        } else {
            if (shellOnly.find(c) != std::string_view::npos) {
                refuse(std::string("'") + c + "' is for a shell and means nothing here; quote it if it is text");
            }
            if (expansions.find(c) != std::string_view::npos) {
                refuseExpansion(c);
            }
            take(1);
        }
    }

    void takeSingleQuoted() {
        std::size_t const end = line_.find('\'', at_ + 1);
        if (end == std::string_view::npos) {
            refuse("a ' is not closed");
        }
        std::size_t const stop = std::min(end, line_.size());
        ++at_;
        take(stop - at_);
        at_ = std::min(stop + 1, line_.size());
    }

    void takeDoubleQuoted() {
        ++at_;
        while (at_ < line_.size() && line_[at_] != '"') {
            char const c = line_[at_];
            bool const escapes =
                c == '\\' && at_ + 1 < line_.size() && escapedInQuotes.find(line_[at_ + 1]) != std::string_view::npos;
            if (escapes) {
                ++at_;
            } else if (expansions.find(c) != std::string_view::npos) {
                refuseExpansion(c);
            }
            take(1);
        }
        if (at_ == line_.size()) {
            refuse("a \" is not closed");
        } else {
            ++at_;
        }
    }

    std::string_view line_;
    bool strict_;
    std::size_t at_ = 0;
    bool inWord_ = false;
    Unfinished found_;

    friend std::vector<std::string> wordsOf(Splitter splitter);
};

std::vector<std::string> wordsOf(Splitter splitter) {
    splitter.split();
    splitter.endWord();
    return splitter.found_.words;
}

} // namespace

std::vector<std::string> splitWords(std::string_view line) {
    return wordsOf(Splitter(line, true));
}

Unfinished splitUnfinished(std::string_view line) {
    return Splitter(line, false).split();
}

std::string quotedWord(std::string const &word) {
    constexpr std::string_view plain = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-_./:=,+@%";
    bool const isPlain = word.find_first_not_of(plain) == std::string::npos;
    if (!word.empty() && isPlain) {
        return word;
    }
    std::string quoted = "'";
    for (char const c : word) {
        quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    }
    return quoted + "'";
}

} // namespace Tovicli::Cli
