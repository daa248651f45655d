// SPDX-License-Identifier: Apache-2.0
//
// Where the shell's lines come from: a person at a terminal, or a file or pipe. What edits lines on a terminal is a
// library of its own (libtovicli-lines.so, on libedit), loaded by the shell there and nowhere else.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace Tovicli::Cli {

struct Line {
    enum class Kind {
        Text,
        Dropped, ///< taken back by Ctrl-C
        TooLong,
        End,
    };
    Kind kind = Kind::End;
    std::string text = {}; ///< without its end
};

class LineSource {
public:
    virtual ~LineSource() = default;
    virtual Line next() = 0;
};

/// What the word before the cursor could become.
struct LineCompletion {
    /// What stands in the word's place when it is certain, quoted, with what follows it; empty: nothing is.
    std::string replacement = {};
    /// Characters before the cursor that it replaces.
    std::size_t replaced = 0;
    /// Shown when there are several.
    std::vector<std::string> choices = {};
};

using CompleteLine = std::function<LineCompletion(std::string const &upToCursor)>;

/// What editing a line takes.
struct LineEditing {
    std::string prompt;
    std::string historyFile; ///< empty: none is kept
    CompleteLine complete;
};

/// The function of libtovicli-lines.so. Prompt and line go to standard error, so that results stay alone on standard
/// output. Null when the terminal cannot be used.
using NewLineEditor = LineSource *(LineEditing const &editing);

/// Lines as they come, without editing; a prompt, if there is one, goes to standard error.
std::unique_ptr<LineSource> plainLines(int descriptor, std::string prompt);

/// Lines edited on the terminal; plain ones where that cannot be had, with the reason in `problem`.
std::unique_ptr<LineSource> editedLines(LineEditing const &editing, std::string &problem);

} // namespace Tovicli::Cli

extern "C" __attribute__((visibility("default"))) Tovicli::Cli::NewLineEditor Tovicli_NewLineEditor;
