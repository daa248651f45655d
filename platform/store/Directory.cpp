// SPDX-License-Identifier: Apache-2.0
#include "store/Directory.h"

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "wire/Failure.h"

namespace Store {
namespace {

constexpr mode_t directoryMode = 0755;

constexpr std::pair<int, Wire::ErrorCode> codes[] = {
    {ENOSPC, Wire::ErrorCode::DiskFull},    {EDQUOT, Wire::ErrorCode::DiskFull},
    {EROFS, Wire::ErrorCode::FileReadOnly}, {EACCES, Wire::ErrorCode::FileReadOnly},
    {EPERM, Wire::ErrorCode::FileReadOnly},
};

[[noreturn]] void cannotMake(std::string const &path, int systemError) {
    auto const *const known =
        std::find_if(std::begin(codes), std::end(codes), [=](auto const &code) { return code.first == systemError; });
    throw Wire::Failure(known != std::end(codes) ? known->second : Wire::ErrorCode::IoError,
                        "the directory '" + path + "' cannot be made: " + std::generic_category().message(systemError));
}

std::string parentOf(std::string const &path) {
    auto const end = path.find_last_not_of('/');
    auto const slash = end == std::string::npos ? std::string::npos : path.rfind('/', end);
    return slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

void syncDirectory(std::string const &path) {
    int const descriptor = ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0) {
        return; // A parent that can be entered but not read: its own file system's order has to do.
    }
    int const systemError = ::fsync(descriptor) == 0 ? 0 : errno;
    ::close(descriptor);
    if (systemError != 0 && systemError != EINVAL) {
        cannotMake(path, systemError);
    }
}

} // namespace

void makeDirectoryDurably(std::string const &path) {
    if (::mkdir(path.c_str(), directoryMode) != 0) {
        int systemError = errno;
        if (systemError == ENOENT && parentOf(path) != path) {
            makeDirectoryDurably(parentOf(path));
            systemError = ::mkdir(path.c_str(), directoryMode) == 0 ? 0 : errno;
        }
        struct stat status {};
        if (systemError == EEXIST && ::stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode)) {
            return;
        }
        if (systemError != 0) {
            cannotMake(path, systemError == EEXIST ? ENOTDIR : systemError);
        }
    }
    syncDirectory(parentOf(path));
}

} // namespace Store
