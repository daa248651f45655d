// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "plexa/AutoCli.h"

namespace Tovicli {

/// Everything that --help shows of a node: what the framework tells of a declaration, and around it what is the tool's:
/// examples, global options, exit statuses.
std::string helpOf(Plexa::AutoCli::NamespaceNode &node, std::string const &program, std::size_t width);

} // namespace Tovicli
