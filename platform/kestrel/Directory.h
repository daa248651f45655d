// SPDX-License-Identifier: Apache-2.0
//
// Directories by descriptor. Below the root, every step is one name relative to a descriptor that is already held, and
// no step follows a symbolic link: whoever swaps a directory for a link between two steps makes the step fail, not go
// astray. Where the kernel has openat2, it is asked to resolve beneath the descriptor and without links; elsewhere
// openat with O_NOFOLLOW says the same about a single name.
#pragma once

#include <string>

#include <sys/types.h>

#include "wire/UniqueFd.h"

namespace Kestrel {

/// A directory that is held open, with its path for sentences.
struct Directory {
    Wire::UniqueFd descriptor;
    std::string path;

    std::string pathOf(std::string const &name) const {
        return path + '/' + name;
    }
};

enum class EntryKind { Nothing, Directory, Other };

/// An absolute path that this host's administrator chose; links in it are followed. Throws Wire::Failure.
Directory openRoot(std::string const &path);

/// Opens the directory `name` in `parent`; one that is missing gives an empty descriptor. Throws Wire::Failure for a
/// symbolic link, for something that is no directory, and for what the system refuses.
Directory openIn(Directory const &parent, std::string const &name);

/// The same, and throws for a directory on which another file system is mounted.
Directory openInSameMount(Directory const &parent, std::string const &name);

/// @return false when something of that name stands there already.
bool makeIn(Directory const &parent, std::string const &name, mode_t mode);

/// Opens, and makes it first when it is missing.
Directory openOrMakeIn(Directory const &parent, std::string const &name, mode_t mode);

/// Links are not followed: one is EntryKind::Other.
EntryKind kindOf(Directory const &parent, std::string const &name);

/// What became of a try to move or remove.
enum class Outcome { Done, NothingThere, InTheWay };

/// Renames; never over something that stands there (InTheWay).
Outcome moveTo(Directory const &from, std::string const &fromName, Directory const &to, std::string const &toName);

/// Removes an empty directory; one with entries, or something else of that name, is InTheWay.
Outcome removeEmptyIn(Directory const &parent, std::string const &name);

/// Any entry of a directory, for a sentence; empty when there is none.
std::string anyEntryIn(Directory const &directory);

/// "cannot be made: Permission denied", with the code that fits. Throws Wire::Failure.
[[noreturn]] void failFor(std::string const &path, std::string const &action, int systemError);

} // namespace Kestrel
