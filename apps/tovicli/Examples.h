// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "plexa/AutoCli.h"

namespace Tovicli {

/// A command line that works, and what it is for.
struct Example {
    /// Words, each as a shell wants it written; the program's name first. Every option stands with its value.
    std::vector<std::string> pieces;
    std::string purpose;
};

/// The command's own examples where it has some, else those that the tool keeps for it; none for a namespace.
std::vector<Example> examplesOf(Plexa::AutoCli::NamespaceNode &node, std::string const &program);

/// Every path that the tool keeps examples for; a test holds that the tree has them.
std::vector<std::string> pathsWithExamples();

} // namespace Tovicli
