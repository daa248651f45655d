// SPDX-License-Identifier: Apache-2.0
//
// From a Topology to an array file that is there whole or not at all.
#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <memory>
#include <string_view>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ArraySchema.h"
#include "FileFailure.h"
#include "RandomUuid.h"
#include "TopologyRows.h"
#include "orka/Topology.h"
#include "wire/ContainerId.h"
#include "wire/Failure.h"
#include "wire/UniqueFd.h"

namespace Orka {

namespace {

constexpr std::pair<int, Wire::ErrorCode> codes[] = {
    {ENOENT, Wire::ErrorCode::FileMissing}, {ENOTDIR, Wire::ErrorCode::FileMissing},
    {ENOSPC, Wire::ErrorCode::DiskFull},    {EDQUOT, Wire::ErrorCode::DiskFull},
    {EROFS, Wire::ErrorCode::FileReadOnly}, {EACCES, Wire::ErrorCode::FileReadOnly},
    {EPERM, Wire::ErrorCode::FileReadOnly},
};

[[noreturn]] void failMaking(std::string const &path, int error) {
    auto const *const known =
        std::find_if(std::begin(codes), std::end(codes), [=](auto const &code) { return code.first == error; });
    throw Wire::Failure(known != std::end(codes) ? known->second : Wire::ErrorCode::IoError,
                        "the array file '" + path + "' cannot be made: " + std::generic_category().message(error));
}

bool exists(std::string const &path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0;
}

constexpr std::string_view draftSuffix = ".new";

std::filesystem::path directoryOf(std::string const &path) {
    auto const directory = std::filesystem::path(path).parent_path();
    return directory.empty() ? std::filesystem::path(".") : directory;
}

/// A directory of this process's own beside the file to be made, with the file in it; goes away with the object. It is
/// locked as long as its maker lives, so that the next maker can tell what a killed one left. The lock is the
/// directory's because SQLite's own locks lie on the file.
class Draft {
public:
    explicit Draft(std::string const &target) {
        removeAbandoned(target);
        do {
            directory_ = target + "." + randomUuid() + std::string(draftSuffix);
            if (mkdir(directory_.c_str(), S_IRWXU) != 0) {
                failMaking(target, errno);
            }
            lock_.reset(openDirectory(directory_));
        } while (!hold()); // another maker came by before the lock and took it for abandoned
    }
    ~Draft() {
        remove(directory_);
    }
    Draft(Draft const &) = delete;
    Draft &operator=(Draft const &) = delete;

    std::string path() const {
        return directory_ + "/array";
    }

private:
    bool hold() const {
        // Where directories cannot be locked nothing is ever taken for abandoned.
        bool const isTaken = flock(lock_.get(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
        return !isTaken && exists(directory_);
    }

    static int openDirectory(std::string const &path) {
        return open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
    }

    static void remove(std::string const &directory) {
        for (char const *const name : {"/array", "/array-journal"}) {
            unlink((directory + name).c_str());
        }
        rmdir(directory.c_str());
    }

    static bool isDraftOf(std::string_view target, std::string_view name) {
        constexpr std::size_t uuidLength = Wire::containerIdLength;
        return name.size() == target.size() + 1 + uuidLength + draftSuffix.size() &&
               name.substr(0, target.size()) == target && name[target.size()] == '.' &&
               Wire::normalizeContainerId(name.substr(target.size() + 1, uuidLength)) &&
               name.substr(name.size() - draftSuffix.size()) == draftSuffix;
    }

    static void removeAbandoned(std::string const &target) {
        std::string const targetName = std::filesystem::path(target).filename().string();
        std::error_code failed; // a directory that cannot be listed is told of by what comes next
        std::filesystem::directory_iterator entry(directoryOf(target), failed);
        for (; !failed && entry != std::filesystem::directory_iterator(); entry.increment(failed)) {
            std::string const path = entry->path().string();
            if (isDraftOf(targetName, entry->path().filename().string())) {
                Wire::UniqueFd const lock(openDirectory(path));
                if (lock && flock(lock.get(), LOCK_EX | LOCK_NB) == 0) {
                    remove(path);
                }
            }
        }
    }

    std::string directory_;
    Wire::UniqueFd lock_;
};

/// Makes a name's change in its directory durable.
void syncDirectoryOf(std::string const &path) {
    int const file = open(directoryOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (file < 0) {
        return; // It can be entered, not read: the file is there, and its file system's own order has to do.
    }
    int const error = fsync(file) == 0 ? 0 : errno;
    close(file);
    if (error != 0) {
        failMaking(path, error);
    }
}

/// The array file that is going to give way, held so that nobody is in the middle of a change when it does. Opening it
/// also rolls back what a killed writer left: its journal lies under a name that would be the new file's.
std::unique_ptr<Sqlite::Database> holdForReplacement(std::string const &path) {
    return onFile([&] {
        auto database = std::make_unique<Sqlite::Database>(path, arrayFileIdentity(), Sqlite::Mode::ReadWrite);
        database->execute("BEGIN EXCLUSIVE");
        return database;
    });
}

void refuseToReplace(std::string const &path) {
    if (exists(path)) {
        throw Wire::Failure(Wire::ErrorCode::AlreadyExists, "'" + path + "' exists already");
    }
    if (exists(path + "-journal")) {
        throw Wire::Failure(Wire::ErrorCode::AlreadyExists,
                            "'" + path + "-journal' exists already and belongs to a file '" + path +
                                "' that is gone; put that file back, or move its journal away");
    }
}

} // namespace

void makeArrayFile(Topology const &topology, std::string const &path, Replace replace) {
    auto const replaces = replace == Replace::ArrayFile && exists(path);
    if (!replaces) {
        refuseToReplace(path);
    }
    Draft const draft(path);
    onFile([&] {
        Sqlite::Database database(draft.path(), arrayFileIdentity(), Sqlite::Mode::Create);
        insertTopology(database, topology);
    });
    if (replaces) {
        auto const held = holdForReplacement(path);
        if (rename(draft.path().c_str(), path.c_str()) != 0) {
            failMaking(path, errno);
        }
    } else if (link(draft.path().c_str(), path.c_str()) != 0) { // unlike a rename, replaces nothing
        int const error = errno;
        refuseToReplace(path);
        failMaking(path, error);
    }
    syncDirectoryOf(path);
}

} // namespace Orka
