// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <sys/types.h>
#include <vector>

#include "Descriptor.h"

namespace Tovicli {

/// A file of a plug-in directory that may be loaded.
struct PluginFile {
    std::string name;
    Descriptor descriptor;
};

/// What a plug-in directory holds. Code found there runs with the user's rights, so the directory and every directory
/// above it must belong to root or the user and be writable by nobody else; above it, a directory of root's in which
/// users cannot rename each other's files (sticky) is good enough.
struct PluginDirectory {
    /// Why nothing of it is used; empty when it is.
    std::string problem;
    /// Regular files "*.so", in order of their names' bytes, open for reading: what is checked through a descriptor is
    /// what is loaded through it.
    std::vector<PluginFile> files;
    /// A line for each "*.so" that is skipped.
    std::vector<std::string> skipped;
};

/// @param user who may own plug-ins besides root
PluginDirectory openPluginDirectory(std::string const &path, uid_t user);

/// The directory alone, by the same rules. What is opened from its descriptor is what its owner has put there, whatever
/// becomes of the links and names that led to it.
/// @param problem why it is not used, when what is returned is not open
Descriptor openTrustedDirectory(std::string const &path, uid_t user, std::string &problem);

} // namespace Tovicli
