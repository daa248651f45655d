// SPDX-License-Identifier: Apache-2.0
#include "GuardedFiles.h"

#include <cerrno>
#include <mutex>
#include <new>

#include <fcntl.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Sqlite {
namespace {

static_assert((codeNoRegularFile & 0xff) == SQLITE_CANTOPEN && (codeNamesAnotherFile & 0xff) == SQLITE_CANTOPEN);

/// A copy of a file system, which it stands in front of.
struct Guard {
    sqlite3_vfs base; // first: SQLite knows the guard by its address
    sqlite3_vfs *original;
    Guard const *previous; // kept for the databases that were opened with it
};

bool isInTheWay(char const *path) {
    struct stat status {};
    return ::lstat(path, &status) == 0 && !S_ISREG(status.st_mode);
}

int openGuarded(sqlite3_vfs *vfs, char const *name, sqlite3_file *file, int flags, int *outFlags) {
    file->pMethods = nullptr; // nothing to close
    if ((flags & SQLITE_OPEN_SUPER_JOURNAL) != 0) {
        return codeNamesAnotherFile;
    }
    // What is put there from here on is found by openWithoutWaiting(), with fewer words.
    if ((flags & (SQLITE_OPEN_MAIN_JOURNAL | SQLITE_OPEN_WAL)) != 0 && name != nullptr && isInTheWay(name)) {
        return codeNoRegularFile;
    }
    sqlite3_vfs *const original = reinterpret_cast<Guard *>(vfs)->original;
    return original->xOpen(original, name, file, flags, outFlags);
}

/// In the place of open(2) in all of SQLite, which also opens directories and the device of random numbers.
int openWithoutWaiting(char const *path, int flags, int mode) {
    int const descriptor = ::open(path, flags | O_NONBLOCK, mode);
    struct stat status {};
    if (descriptor < 0 || ::fstat(descriptor, &status) != 0 || !S_ISFIFO(status.st_mode)) {
        return descriptor;
    }
    ::close(descriptor);
    errno = EINVAL;
    return -1;
}

} // namespace

char const *guardedFiles() {
    static constexpr char const *name = "guarded";
    static std::mutex mutex;
    static Guard *guard = nullptr;
    std::lock_guard const lock(mutex);
    sqlite3_vfs *const original = sqlite3_vfs_find(nullptr);
    if (original == nullptr) {
        throw std::bad_alloc(); // SQLite could not begin
    }
    if (guard != nullptr && guard->original == original && guard->base.pAppData == original->pAppData) {
        return name;
    }
    // Once a process: only what tests disks makes another file system the default.
    auto *const next = new Guard{*original, original, guard};
    if (guard == nullptr) {
        sqlite3_vfs *const real = sqlite3_vfs_find("unix");
        real->xSetSystemCall(real, "open", reinterpret_cast<sqlite3_syscall_ptr>(openWithoutWaiting));
    } else {
        sqlite3_vfs_unregister(&guard->base);
    }
    guard = next;
    guard->base.zName = name;
    guard->base.pNext = nullptr;
    guard->base.xOpen = openGuarded;
    sqlite3_vfs_register(&guard->base, 0);
    return name;
}

} // namespace Sqlite
