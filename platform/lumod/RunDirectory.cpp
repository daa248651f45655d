// SPDX-License-Identifier: Apache-2.0
#include "lumod/RunDirectory.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fmt/format.h>

#include "wire/Failure.h"
#include "wire/SocketAddress.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

constexpr mode_t rootMode = 0755; // users reach the mounted volumes below it
constexpr mode_t ownMode = 0700;
constexpr mode_t groupMode = 0750;
constexpr mode_t socketMode = 0660;
constexpr int backlog = 4096;

[[noreturn]] void fail(std::string const &what, std::string const &path) {
    throw Failure(ErrorCode::IoError, fmt::format("{} {}: {}", what, path, std::strerror(errno)));
}

/// Whoever may change a directory decides what the daemon's files in it are: that must be the daemon's own user or
/// root.
void requireTrusted(std::string const &path, struct stat const &status) {
    if (status.st_uid != 0 && status.st_uid != ::geteuid()) {
        throw Failure(ErrorCode::NotPermitted,
                      fmt::format("the directory {} belongs to user {}, who is neither root nor the daemon's own user",
                                  path, status.st_uid));
    }
    if ((status.st_mode & S_IWOTH) != 0) {
        throw Failure(
            ErrorCode::NotPermitted,
            fmt::format("every user may write to the directory {} (mode {:04o}); the daemon needs one of its own", path,
                        status.st_mode & 07777));
    }
}

} // namespace

RunDirectory::RunDirectory(Wire::Paths paths, std::optional<gid_t> group)
    : paths_(std::move(paths))
    , group_(group) {
    mode_t const mode = group_ ? groupMode : ownMode;
    if (::mkdir(paths_.root().c_str(), rootMode) != 0 && errno != EEXIST) {
        fail("cannot make the root directory", paths_.root());
    }
    struct stat status {};
    if (::stat(paths_.root().empty() ? "/" : paths_.root().c_str(), &status) != 0) {
        fail("cannot look at the root directory", paths_.root());
    }
    requireTrusted(paths_.root(), status);
    makeDirectory(paths_.run(), mode);
    makeDirectory(paths_.logs(), mode);
    lock();
    writePid();
}

RunDirectory::~RunDirectory() {
    if (boundOrdered_) {
        ::unlink(paths_.orderedSocket().c_str());
    }
    if (boundPriority_) {
        ::unlink(paths_.prioritySocket().c_str());
    }
    ::unlink(paths_.pidFile().c_str());
}

void RunDirectory::makeDirectory(std::string const &path, mode_t mode) const {
    if (::mkdir(path.c_str(), mode) != 0 && errno != EEXIST) {
        fail("cannot make the directory", path);
    }
    Wire::UniqueFd const directory(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    struct stat status {};
    if (!directory || ::fstat(directory.get(), &status) != 0) {
        fail("cannot open the directory", path);
    }
    if (status.st_uid != ::geteuid()) {
        requireTrusted(path, status);
        return; // prepared by an administrator, who decides who may enter it
    }
    if (group_ && status.st_gid != *group_ && ::fchown(directory.get(), static_cast<uid_t>(-1), *group_) != 0) {
        fail("cannot give the group the directory", path);
    }
    if ((status.st_mode & 0777) != mode && ::fchmod(directory.get(), mode) != 0) {
        fail("cannot set the mode of the directory", path);
    }
}

void RunDirectory::lock() {
    std::string const path = paths_.lockFile();
    lock_.reset(::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    if (!lock_) {
        fail("cannot open the lock file", path);
    }
    if (::flock(lock_.get(), LOCK_EX | LOCK_NB) == 0) {
        return;
    }
    if (errno != EWOULDBLOCK) {
        fail("cannot lock", path);
    }
    std::array<char, 32> text{};
    Wire::UniqueFd const pidFile(::open(paths_.pidFile().c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    ssize_t const bytes = pidFile ? ::read(pidFile.get(), text.data(), text.size() - 1) : 0;
    std::string const pid(text.data(), bytes > 0 ? std::strcspn(text.data(), "\n") : 0);
    throw Failure(ErrorCode::InUse,
                  fmt::format("another daemon{} serves {} already: it holds the lock {}",
                              pid.empty() ? "" : fmt::format(" (process {})", pid), paths_.root(), path));
}

void RunDirectory::writePid() const {
    // A new file in place of the old one: a reader sees a whole number or none.
    std::string const path = paths_.pidFile();
    std::string const next = path + ".new";
    ::unlink(next.c_str());
    Wire::UniqueFd file(::open(next.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644));
    std::string const text = fmt::format("{}\n", ::getpid());
    if (!file || ::write(file.get(), text.data(), text.size()) != static_cast<ssize_t>(text.size()) ||
        ::rename(next.c_str(), path.c_str()) != 0) {
        fail("cannot write the pid file", path);
    }
}

Wire::UniqueFd RunDirectory::bindOrderedSocket() {
    Wire::UniqueFd socket = bind(paths_.orderedSocket());
    boundOrdered_ = true;
    return socket;
}

Wire::UniqueFd RunDirectory::bindPrioritySocket() {
    Wire::UniqueFd socket = bind(paths_.prioritySocket());
    boundPriority_ = true;
    return socket;
}

Wire::UniqueFd RunDirectory::bind(std::string const &path) {
    struct stat status {};
    if (::lstat(path.c_str(), &status) == 0) {
        if (!S_ISSOCK(status.st_mode)) {
            errno = EEXIST;
            fail("something that is no socket is in the place of the socket", path);
        }
        if (::unlink(path.c_str()) != 0) {
            fail("cannot remove the stale socket", path);
        }
    }
    Wire::UniqueFd socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    if (!socket) {
        fail("cannot make the socket", path);
    }
    Wire::SocketAddress const address(path);
    // Nobody can connect before the socket listens, and then its mode is set.
    if (::bind(socket.get(), address.get(), address.size()) != 0) {
        fail("cannot bind the socket", path);
    }
    if (group_ && ::lchown(path.c_str(), static_cast<uid_t>(-1), *group_) != 0) {
        fail("cannot give the group the socket", path);
    }
    if (::chmod(path.c_str(), socketMode) != 0) {
        fail("cannot set the mode of the socket", path);
    }
    if (::listen(socket.get(), backlog) != 0) {
        fail("cannot listen on the socket", path);
    }
    return socket;
}

} // namespace Lumod
