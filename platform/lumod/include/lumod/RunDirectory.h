// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

#include <sys/types.h>

#include "wire/Paths.h"
#include "wire/UniqueFd.h"

namespace Lumod {

/// The directories run/ and log/ below a root, and the lock that makes this process the root's only daemon. Whoever
/// holds it may replace the sockets and the pid file that a killed daemon left; nobody else touches them.
class RunDirectory {
public:
    /// Makes the root and the two directories if need be, takes the lock and writes the pid file.
    /// @param group owns the directories, so that its members reach the sockets; nothing: only the owner does
    /// @throws Wire::Failure InUse when another daemon holds the lock; NotPermitted when somebody else than root and
    /// the daemon's own user could change these directories; IoError, naming the path
    RunDirectory(Wire::Paths paths, std::optional<gid_t> group);
    /// Removes the pid file and the sockets that it bound. The lock file stays: removing it would let two processes
    /// lock two files of one name.
    ~RunDirectory();
    RunDirectory(RunDirectory const &) = delete;
    RunDirectory &operator=(RunDirectory const &) = delete;

    /// Binds a socket of the root in place of whatever socket is there, mode 0660, and listens.
    /// @throws Wire::Failure IoError; something that is no socket is left alone
    Wire::UniqueFd bindOrderedSocket();
    Wire::UniqueFd bindPrioritySocket();

private:
    void makeDirectory(std::string const &path, mode_t mode) const;
    void lock();
    void writePid() const;
    Wire::UniqueFd bind(std::string const &path);

    Wire::Paths paths_;
    std::optional<gid_t> group_;
    Wire::UniqueFd lock_;
    bool boundOrdered_ = false;
    bool boundPriority_ = false;
};

} // namespace Lumod
