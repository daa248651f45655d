// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "Frame.h"

namespace Tovicli::Cli {

/// A command of the tree and where it came from.
struct KnownCommand {
    CommandPtr command;
    std::string path;   ///< its words, a blank between them
    std::string plugin; ///< the file whose code it is; empty for the tool's own
};

/// Every command below a node, in the order in which help shows them.
std::vector<KnownCommand> commandsBelow(Plexa::AutoCli::NamespaceNode &node);

/// The file name of the plug-in that holds a command's code; empty when it is none of a plug-in
/// (loaded plug-ins are known to the system by the descriptors they were loaded through).
std::string pluginOf(Plexa::AutoCli::Command &command);

/// Hangs the plug-ins into the tree and warns of those that cannot be had.
void growAndWarn(CliServices &services);

/// Follows words down from a node. @throws Plexa::UsageError for a word that names nothing, with what is near it
NodePtr nodeAt(NodePtr node, std::vector<std::string> const &words);

} // namespace Tovicli::Cli
