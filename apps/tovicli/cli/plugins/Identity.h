// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "plugins/Inspection.h"

namespace Tovicli::Cli {

/// How a file's first bytes differ from those of this machine's shared libraries.
struct Identity {
    std::vector<Finding> differences;
};
Identity identityOf(int descriptor);

/// A name that a library offers, or one that it expects others to offer.
struct Symbol {
    std::string name;
    bool defined = false;
    /// Missing, it is taken as absent; nothing fails.
    bool weak = false;
};

/// The global names of a library whose headers readElfFile() has found sound. None when its sections are gone.
std::vector<Symbol> dynamicSymbols(int descriptor);

} // namespace Tovicli::Cli
