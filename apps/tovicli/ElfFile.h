// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace Tovicli {

/// What a library's file says before anything of it is loaded.
struct ElfFile {
    /// Why it cannot be loaded here; empty when nothing speaks against it.
    std::string problem;
    /// Names of the libraries that it needs.
    std::vector<std::string> needed;
};

/// Reads the headers and the dynamic section of a shared library. Only pread is used: neither the descriptor's offset
/// moves, nor can a file that shrinks meanwhile kill the reader, as it could through a mapping.
ElfFile readElfFile(int descriptor);

} // namespace Tovicli
