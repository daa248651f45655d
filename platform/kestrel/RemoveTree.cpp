// SPDX-License-Identifier: Apache-2.0
#include "RemoveTree.h"

#include <cerrno>
#include <cstdint>
#include <memory>
#include <string_view>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Kestrel {
namespace {

using Listing = std::unique_ptr<DIR, int (*)(DIR *)>;

Listing list(Directory const &directory) {
    int const own = ::openat(directory.descriptor.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    Listing listing(own < 0 ? nullptr : ::fdopendir(own), ::closedir);
    if (!listing) {
        int const systemError = errno;
        if (own >= 0) {
            ::close(own);
        }
        failFor(directory.path, "read", systemError);
    }
    return listing;
}

/// Its owner may have locked himself out; a tree that is to go is opened all the same. Through a descriptor, so that no
/// link is followed.
void allowOwner(Directory const &parent, std::string const &name) {
    Wire::UniqueFd const entry(
        ::openat(parent.descriptor.get(), name.c_str(), O_PATH | O_NOFOLLOW | O_DIRECTORY | O_CLOEXEC));
    if (entry) {
        ::chmod(("/proc/self/fd/" + std::to_string(entry.get())).c_str(), S_IRWXU);
    }
}

Directory openToEmpty(Directory const &parent, std::string const &name) {
    struct stat status {};
    if (::fstatat(parent.descriptor.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
        S_ISDIR(status.st_mode) && (status.st_mode & S_IRWXU) != S_IRWXU) {
        allowOwner(parent, name);
    }
    return openInSameMount(parent, name);
}

/// @return true when it is gone, false when it is a directory
bool removeFile(Directory const &parent, std::string const &name) {
    if (::unlinkat(parent.descriptor.get(), name.c_str(), 0) == 0 || errno == ENOENT) {
        return true;
    }
    // A directory gives EISDIR here and EPERM elsewhere.
    if (errno != EISDIR && errno != EPERM) {
        failFor(parent.pathOf(name), "removed", errno);
    }
    int const systemError = errno;
    if (kindOf(parent, name) != EntryKind::Directory) {
        failFor(parent.pathOf(name), "removed", systemError);
    }
    return false;
}

class TreeRemover {
public:
    explicit TreeRemover(Directory const &top)
        : top_(top) {}

    void empty() {
        // Entries that were moved up while a listing was being read may be missing in it.
        while (emptyOnce()) {
        }
    }

private:
    /// @return whether there was anything
    bool emptyOnce() {
        bool any = false;
        Listing const listing = list(top_);
        while (dirent const *const entry = ::readdir(listing.get())) {
            std::string const name = entry->d_name;
            if (name == "." || name == "..") {
                continue;
            }
            any = true;
            if (!removeFile(top_, name)) {
                removeDirectory(name);
            }
        }
        return any;
    }

    void removeDirectory(std::string const &name) {
        if (::unlinkat(top_.descriptor.get(), name.c_str(), AT_REMOVEDIR) == 0) {
            return;
        }
        Directory const directory = openToEmpty(top_, name);
        if (!directory.descriptor) {
            return;
        }
        Listing const listing = list(directory);
        while (dirent const *const entry = ::readdir(listing.get())) {
            std::string const child = entry->d_name;
            if (child != "." && child != ".." && !removeFile(directory, child)) {
                moveUp(directory, child);
            }
        }
        if (removeEmptyIn(top_, name) == Outcome::InTheWay && ++retries_ > retriesMax) {
            failFor(directory.path, "removed", ENOTEMPTY);
        }
    }

    void moveUp(Directory const &from, std::string const &child) {
        if (::unlinkat(from.descriptor.get(), child.c_str(), AT_REMOVEDIR) == 0) {
            return;
        }
        if (::faccessat(from.descriptor.get(), child.c_str(), W_OK, AT_EACCESS | AT_SYMLINK_NOFOLLOW) != 0) {
            allowOwner(from, child); // a directory that changes its parent must be writable itself
        }
        while (moveTo(from, child, top_, ".moved-" + std::to_string(next_++)) == Outcome::InTheWay) {
        }
    }

    /// Somebody may go on writing into the tree; he is not outrun forever.
    static constexpr int retriesMax = 1000;

    Directory const &top_;
    uint64_t next_ = 0;
    int retries_ = 0;
};

} // namespace

void removeTree(Directory const &parent, std::string const &name) {
    switch (kindOf(parent, name)) {
    case EntryKind::Nothing:
        return;
    case EntryKind::Other:
        removeFile(parent, name);
        return;
    case EntryKind::Directory:
        break;
    }
    for (int tries = 0; tries < 10; ++tries) {
        {
            Directory const top = openToEmpty(parent, name);
            if (!top.descriptor) {
                return;
            }
            TreeRemover(top).empty();
        }
        if (removeEmptyIn(parent, name) != Outcome::InTheWay) {
            return;
        }
    }
    failFor(parent.pathOf(name), "removed", ENOTEMPTY);
}

} // namespace Kestrel
