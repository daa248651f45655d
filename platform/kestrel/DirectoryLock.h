// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>

#include "Directory.h"

namespace Kestrel {

/// Holds a directory's advisory lock, so that a record and the rename that follows it are one step for every other
/// process of this host. Ends with its holder, however that dies.
class DirectoryLock {
public:
    /// Waits at most that long, then throws Wire::Failure (FileBusy). Opens the directory anew: a lock belongs to an
    /// open file description.
    DirectoryLock(Directory const &directory, std::chrono::milliseconds timeout);

private:
    Wire::UniqueFd descriptor_;
};

} // namespace Kestrel
