// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace Tovicli::Cli {

/// Paths of the files "*.so" of a directory, whether they may be loaded or not, in the order in which they would be.
std::vector<std::string> pluginFiles(std::string const &directory);

/// The plug-ins of the directory that have taken their names before a file's turn comes: those before it when it lies
/// there, all of them when it lies elsewhere.
std::vector<std::string> loadedBefore(std::string const &file, std::string const &directory);

/// Where the platform's libraries lie: above this one.
std::string installedLibraries();

} // namespace Tovicli::Cli
