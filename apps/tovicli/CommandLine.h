// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "Settings.h"
#include "plexa/AutoCli.h"

namespace Tovicli {

/// The words of a command line, read against the tree.
struct CommandLine {
    boost::shared_ptr<Plexa::AutoCli::NamespaceNode> node;
    boost::shared_ptr<Plexa::CallSpec::Input> global; ///< the tool's own options
    boost::shared_ptr<Plexa::CallSpec::Input> input;  ///< the command's parameters
};

/// A mistake, and how far the words led before it.
struct Misread {
    boost::shared_ptr<Plexa::AutoCli::NamespaceNode> node;
    std::string sentence;
    /// The word names nothing in the tree, as opposed to options that are wrong.
    bool unknownWord = false;
};

/// Follows the words down the tree and reads the options: before the command the tool's own, behind it the command's
/// and, where it declares none of the name, the tool's. The reading is empty when there is a mistake.
/// @param misread set when there is a mistake
CommandLine readCommandLine(boost::shared_ptr<Plexa::AutoCli::NamespaceNode> const &root,
                            std::vector<std::string> const &words, Misread &misread);

/// What can be known of the global options before any plug-in is loaded.
struct FirstReading {
    /// Options before the first word of the path: these are the tool's for certain.
    boost::shared_ptr<Plexa::CallSpec::Input> certain;
    /// Those and what looks like global options behind it. A command may turn out to declare one of these names.
    boost::shared_ptr<Plexa::CallSpec::Input> probable;
    /// Where the path begins; the end when there is none.
    std::size_t pathAt = 0;
};

/// @throws Plexa::UsageError for a mistake before the first word of the path
FirstReading readAhead(std::vector<std::string> const &words);

} // namespace Tovicli
