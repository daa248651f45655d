// SPDX-License-Identifier: Apache-2.0
//
// What a word could become: the tree's names, a command's options, values. For the tool's own shell, and for other
// shells, whose scripts know the tree and ask for live values only.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "Frame.h"
#include "completion/LiveValues.h"

namespace Tovicli::Cli {

struct Completion {
    /// Words: the candidates. Files, Directories: what the file system holds, which a shell knows to complete.
    enum class Kind { Words, Files, Directories };
    Kind kind = Kind::Words;
    /// Those that begin with what was typed.
    std::vector<Candidate> candidates = {};
    /// Of the word, what stands before the value that is completed: "--vp-name=" or nothing.
    std::string before = {};
};

/// Asks for live values; the query's root and offline are those of the command line where it names them.
using AskLive = std::function<std::vector<Candidate>(LiveQuery const &query)>;

/// @param root    a tree with everything in it
/// @param query   root and offline of this run
/// @param words   those before the word to complete, without the program's name
/// @param current that word, as far as it is typed
Completion complete(NodePtr const &root, LiveQuery const &query, AskLive const &ask,
                    std::vector<std::string> const &words, std::string const &current);

} // namespace Tovicli::Cli
