// SPDX-License-Identifier: Apache-2.0
#include "Directory.h"

#include <cerrno>
#include <cstdio>
#include <memory>
#include <string_view>
#include <system_error>

#include <dirent.h>
#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "wire/Failure.h"

namespace Kestrel {
namespace {

Wire::ErrorCode codeOf(int systemError) {
    switch (systemError) {
    case ENOSPC:
    case EDQUOT:
        return Wire::ErrorCode::DiskFull;
    case EROFS:
        return Wire::ErrorCode::FileReadOnly;
    case EACCES:
    case EPERM:
        return Wire::ErrorCode::NotPermitted;
    case ENOENT:
        return Wire::ErrorCode::FileMissing;
    default:
        return Wire::ErrorCode::IoError;
    }
}

constexpr int directoryFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;

bool onOneDevice(int first, int second) {
    struct stat one {};
    struct stat other {};
    return ::fstat(first, &one) == 0 && ::fstat(second, &other) == 0 && one.st_dev == other.st_dev;
}

/// Resolves one name beneath a directory, following nothing.
Wire::UniqueFd openBeneath(int parent, char const *name, bool sameMount) {
    open_how how{};
    how.flags = directoryFlags;
    how.resolve = RESOLVE_BENEATH | RESOLVE_NO_SYMLINKS | RESOLVE_NO_MAGICLINKS | (sameMount ? RESOLVE_NO_XDEV : 0U);
    long result = -1;
    do {
        result = ::syscall(SYS_openat2, parent, name, &how, sizeof(how));
    } while (result < 0 && errno == EAGAIN); // something on the way was being renamed; the kernel asks to try again
    if (result >= 0 || (errno != ENOSYS && errno != EPERM)) {
        return Wire::UniqueFd(static_cast<int>(result));
    }
    // An older kernel, or a sandbox that does not know the call.
    Wire::UniqueFd descriptor(::openat(parent, name, directoryFlags));
    if (descriptor && sameMount && !onOneDevice(parent, descriptor.get())) {
        errno = EXDEV;
        return Wire::UniqueFd();
    }
    return descriptor;
}

Directory openChecked(Directory const &parent, std::string const &name, bool sameMount) {
    Wire::UniqueFd descriptor = openBeneath(parent.descriptor.get(), name.c_str(), sameMount);
    if (!descriptor && errno != ENOENT) {
        int systemError = errno;
        // A link gives ELOOP or ENOTDIR, as the kernel happens to look first.
        struct stat status {};
        if (systemError == ENOTDIR &&
            ::fstatat(parent.descriptor.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
            S_ISLNK(status.st_mode)) {
            systemError = ELOOP;
        }
        failFor(parent.pathOf(name), "opened", systemError);
    }
    return {std::move(descriptor), parent.pathOf(name)};
}

} // namespace

void failFor(std::string const &path, std::string const &action, int systemError) {
    std::string const reason = systemError == ELOOP     ? "a symbolic link stands there"
                               : systemError == EXDEV   ? "it is on another file system"
                               : systemError == ENOTDIR ? "it is no directory"
                                                        : std::generic_category().message(systemError);
    throw Wire::Failure(codeOf(systemError), "the directory '" + path + "' cannot be " + action + ": " + reason);
}

Directory openRoot(std::string const &path) {
    Wire::UniqueFd descriptor(::open(path.empty() ? "/" : path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!descriptor) {
        failFor(path, "opened", errno);
    }
    return {std::move(descriptor), path};
}

Directory openIn(Directory const &parent, std::string const &name) {
    return openChecked(parent, name, false);
}

Directory openInSameMount(Directory const &parent, std::string const &name) {
    return openChecked(parent, name, true);
}

bool makeIn(Directory const &parent, std::string const &name, mode_t mode) {
    if (::mkdirat(parent.descriptor.get(), name.c_str(), mode) == 0) {
        return true;
    }
    if (errno != EEXIST) {
        failFor(parent.pathOf(name), "made", errno);
    }
    return false;
}

Directory openOrMakeIn(Directory const &parent, std::string const &name, mode_t mode) {
    Directory directory = openIn(parent, name);
    if (!directory.descriptor) {
        makeIn(parent, name, mode);
        directory = openIn(parent, name);
        if (!directory.descriptor) {
            failFor(parent.pathOf(name), "opened", ENOENT);
        }
    }
    return directory;
}

EntryKind kindOf(Directory const &parent, std::string const &name) {
    struct stat status {};
    if (::fstatat(parent.descriptor.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
        if (errno != ENOENT) {
            failFor(parent.pathOf(name), "looked at", errno);
        }
        return EntryKind::Nothing;
    }
    return S_ISDIR(status.st_mode) ? EntryKind::Directory : EntryKind::Other;
}

Outcome moveTo(Directory const &from, std::string const &fromName, Directory const &to, std::string const &toName) {
    int const source = from.descriptor.get();
    int const target = to.descriptor.get();
    if (::renameat2(source, fromName.c_str(), target, toName.c_str(), RENAME_NOREPLACE) == 0) {
        return Outcome::Done;
    }
    int systemError = errno;
    if (systemError == EINVAL || systemError == ENOSYS) {
        // A file system without the flag. The callers hold the host's lock, so that only a stranger could slip in here,
        // and rename refuses to replace anything but an empty directory by a directory.
        if (kindOf(to, toName) != EntryKind::Nothing) {
            return Outcome::InTheWay;
        }
        if (::renameat(source, fromName.c_str(), target, toName.c_str()) == 0) {
            return Outcome::Done;
        }
        systemError = errno;
    }
    if (systemError == ENOENT) {
        return Outcome::NothingThere;
    }
    if (systemError == EEXIST || systemError == ENOTEMPTY) {
        return Outcome::InTheWay;
    }
    failFor(from.pathOf(fromName), "moved to '" + to.pathOf(toName) + '\'', systemError);
}

Outcome removeEmptyIn(Directory const &parent, std::string const &name) {
    if (::unlinkat(parent.descriptor.get(), name.c_str(), AT_REMOVEDIR) == 0) {
        return Outcome::Done;
    }
    switch (errno) {
    case ENOENT:
        return Outcome::NothingThere;
    case ENOTEMPTY:
    case EEXIST:
    case ENOTDIR:
        return Outcome::InTheWay;
    default:
        failFor(parent.pathOf(name), "removed", errno);
    }
}

std::string anyEntryIn(Directory const &directory) {
    int const own = ::fcntl(directory.descriptor.get(), F_DUPFD_CLOEXEC, 3);
    std::unique_ptr<DIR, int (*)(DIR *)> const listing(own < 0 ? nullptr : ::fdopendir(own), ::closedir);
    if (!listing) {
        if (own >= 0) {
            ::close(own);
        }
        return {};
    }
    ::rewinddir(listing.get());
    while (dirent const *const entry = ::readdir(listing.get())) {
        std::string_view const name = entry->d_name;
        if (name != "." && name != "..") {
            return std::string(name);
        }
    }
    return {};
}

} // namespace Kestrel
