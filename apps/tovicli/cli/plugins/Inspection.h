// SPDX-License-Identifier: Apache-2.0
//
// A plug-in's file looked at closely: everything that keeps the tool from using it, not only the first thing.
//
// What the file says is read without running any of it. Only a file that nothing speaks against so far, and that nobody
// else could have written, is then loaded and registered as the tool would, in a process of its own: a plug-in that
// crashes or hangs takes that process with it and is told about like any other.
#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "Descriptor.h"
#include "Frame.h"

namespace Tovicli::Cli {

/// One thing that was found: which rule, and what breaks it.
struct Finding {
    /// "file", "permissions", "elf", "class", "machine", "abi", "entry point", "symbol", "library", "load",
    /// "registration", "name".
    std::string check;
    std::string detail;
};

/// What a plug-in was built against: "libplexa.so.1", and whichever of the platform's other libraries it needs,
/// separated by blanks; empty when that cannot be read.
std::string abiOf(std::string const &file);

struct Question {
    std::string file;
    /// Plug-ins that have taken their names already: a directory's, in the order in which they are loaded.
    std::vector<std::string> earlier;
    /// Where the platform's libraries lie.
    std::string libraryDirectory;
    std::chrono::milliseconds timeout;
};

/// @return nothing when the tool would use the plug-in
std::vector<Finding> inspect(Question const &question);

/// What can be seen without loading anything.
struct Inspected {
    std::vector<Finding> findings;
    /// The file that was looked at. Only this may be loaded, and only when there are no findings: by its path there may
    /// be another one by now.
    Descriptor file;
};

Inspected inspectFile(std::string const &file);

} // namespace Tovicli::Cli
