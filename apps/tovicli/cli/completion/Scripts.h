// SPDX-License-Identifier: Apache-2.0
//
// Completion scripts for shells, made from the declarations: names, options and fixed values stand in the script, so
// that completing them starts no process; values that only the host or its daemon know are asked for with the command
// `cli complete`. A script serves the plug-ins that were there when it was made.
#pragma once

#include <string>
#include <vector>

#include "Frame.h"
#include "completion/ValueSource.h"

namespace Tovicli::Cli {

struct OptionEntry {
    std::string name;
    std::string alias; ///< one letter; empty when there is none
    std::string description;
    ValueSource source;
    bool isList = false;
};

/// A node of the tree as a script knows it.
struct NodeEntry {
    std::string path; ///< words with blanks between them; empty for the root
    bool isCommand = false;
    std::vector<std::pair<std::string, std::string>> children; ///< names and descriptions
    std::vector<OptionEntry> options;
    /// What words without an option are; Text when there are none.
    ValueSource positional;
};

/// The root first; its options are the tool's own.
std::vector<NodeEntry> completionTable(Plexa::AutoCli::NamespaceNode &root);

std::string bashScript(std::vector<NodeEntry> const &table);
std::string zshScript(std::vector<NodeEntry> const &table);
std::string fishScript(std::vector<NodeEntry> const &table);

/// Between single quotes, as bash and zsh read it; what would act on a terminal is escaped.
std::string shellQuoted(std::string const &text);

/// How the scripts of bash and zsh write a source: "flag", "text", "words true false", "files", "directories", "path",
/// "live".
std::string sourceText(ValueSource const &source);

} // namespace Tovicli::Cli
