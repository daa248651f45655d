// SPDX-License-Identifier: Apache-2.0
#include "DirectoryLock.h"

#include <algorithm>
#include <cerrno>
#include <thread>

#include <fcntl.h>
#include <sys/file.h>

#include "wire/Failure.h"

namespace Kestrel {

DirectoryLock::DirectoryLock(Directory const &directory, std::chrono::milliseconds timeout)
    : descriptor_(::openat(directory.descriptor.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
    if (!descriptor_) {
        failFor(directory.path, "locked", errno);
    }
    auto const deadline = std::chrono::steady_clock::now() + timeout;
    std::chrono::milliseconds pause{1};
    // flock has no timeout of its own; holders keep the lock for one transaction and one rename.
    while (::flock(descriptor_.get(), LOCK_EX | LOCK_NB) != 0) {
        if (errno != EWOULDBLOCK && errno != EINTR) {
            failFor(directory.path, "locked", errno);
        }
        if (std::chrono::steady_clock::now() >= deadline) {
            throw Wire::Failure(Wire::ErrorCode::FileBusy, "the directory '" + directory.path +
                                                               "' is busy: another process has held its lock for " +
                                                               std::to_string(timeout.count()) + " ms");
        }
        std::this_thread::sleep_for(pause);
        pause = std::min(pause * 2, std::chrono::milliseconds{50});
    }
}

} // namespace Kestrel
