// SPDX-License-Identifier: Apache-2.0
//
// From a Topology to an array file that is there whole or not at all.
#include <cerrno>
#include <filesystem>
#include <memory>
#include <system_error>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ArraySchema.h"
#include "FileFailure.h"
#include "RandomUuid.h"
#include "TopologyRows.h"
#include "orka/Topology.h"
#include "wire/Failure.h"

namespace Orka {

namespace {

[[noreturn]] void failMaking(std::string const &path, int error) {
    auto code = Wire::ErrorCode::IoError;
    if (error == ENOENT || error == ENOTDIR) {
        code = Wire::ErrorCode::FileMissing;
    } else if (error == ENOSPC || error == EDQUOT) {
        code = Wire::ErrorCode::DiskFull;
    } else if (error == EROFS || error == EACCES || error == EPERM) {
        code = Wire::ErrorCode::FileReadOnly;
    }
    throw Wire::Failure(code,
                        "the array file '" + path + "' cannot be made: " + std::generic_category().message(error));
}

bool exists(std::string const &path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0;
}

/// A file of this process's own beside the one to be made; goes away with the object.
class Draft {
public:
    explicit Draft(std::string const &target)
        : path_(target + "." + randomUuid() + ".new") {
        int const file = open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC | O_NOFOLLOW, 0666);
        if (file < 0) {
            failMaking(target, errno);
        }
        close(file);
    }
    ~Draft() {
        unlink(path_.c_str());
        unlink((path_ + "-journal").c_str());
    }
    Draft(Draft const &) = delete;
    Draft &operator=(Draft const &) = delete;

    std::string const &path() const noexcept {
        return path_;
    }

private:
    std::string path_;
};

/// Makes a name's change in its directory durable.
void syncDirectoryOf(std::string const &path) {
    auto directory = std::filesystem::path(path).parent_path();
    if (directory.empty()) {
        directory = ".";
    }
    int const file = open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (file < 0) {
        failMaking(path, errno);
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
