// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "plexa/AutoCli.h"

namespace Plexa {

/// What a namespace holds: usage line, description, namespaces and commands with their descriptions, in the order in
/// which they were registered.
std::string namespaceHelp(AutoCli::NamespaceNode &node, std::string const &program, std::size_t width);

/// A command's help as the command itself generates it.
std::string commandHelpText(AutoCli::Command &command, std::string const &program, std::size_t width);

/// The tool's own options as they stand under every help text.
std::string globalOptionsHelp(CallSpec::InputSpec const &options, std::size_t width);

} // namespace Plexa
