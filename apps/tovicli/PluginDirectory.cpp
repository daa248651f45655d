// SPDX-License-Identifier: Apache-2.0
#include "PluginDirectory.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <memory>
#include <sys/stat.h>
#include <utility>

namespace Tovicli {

namespace {

std::string systemText(int error) {
    return std::strerror(error);
}

/// Why others than root and the user could change what something holds; empty when they could not.
std::string ownershipProblem(struct stat const &status, uid_t user, bool stickyWillDo) {
    if (status.st_uid != 0 && status.st_uid != user) {
        return "belongs to neither root nor the user";
    }
    bool const othersWrite = (status.st_mode & (S_IWGRP | S_IWOTH)) != 0;
    bool const sticky = status.st_uid == 0 && (status.st_mode & S_ISVTX) != 0;
    if (othersWrite && !(stickyWillDo && sticky)) {
        return "can be written by others";
    }
    return {};
}

/// Opens a directory that no link leads to, if nobody else can exchange it. The directories above it are looked at from
/// the root down: who could put something else into one of them was found trustworthy before what it holds is looked
/// at.
Descriptor openChecked(std::string const &canonical, uid_t user, std::string &problem) {
    struct stat status {};
    for (std::size_t end = 1; end < canonical.size(); end = std::min(canonical.find('/', end + 1), canonical.size())) {
        std::string const above = canonical.substr(0, end);
        if (lstat(above.c_str(), &status) != 0) {
            problem = "'" + above + "': " + systemText(errno);
        } else if (!S_ISDIR(status.st_mode)) {
            problem = "'" + above + "': " + systemText(ENOTDIR);
        } else if (std::string const found = ownershipProblem(status, user, true); !found.empty()) {
            problem = "'" + above + "' " + found;
        }
        if (!problem.empty()) {
            return Descriptor();
        }
    }
    Descriptor directory(open(canonical.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    if (!directory.isOpen() || fstat(directory.number(), &status) != 0) {
        problem = "'" + canonical + "': " + systemText(errno);
    } else if (std::string const found = ownershipProblem(status, user, false); !found.empty()) {
        problem = "'" + canonical + "' " + found;
    }
    return problem.empty() ? std::move(directory) : Descriptor();
}

std::vector<std::string> libraryNames(Descriptor const &directory, std::string &problem) {
    std::vector<std::string> names;
    // A stream owns its descriptor: it gets one of its own.
    int const own = openat(directory.number(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    auto const closeStream = [](DIR *stream) { closedir(stream); };
    std::unique_ptr<DIR, decltype(closeStream)> const stream(own >= 0 ? fdopendir(own) : nullptr, closeStream);
    if (stream == nullptr) {
        problem = systemText(errno);
        return names;
    }
    errno = 0;
    while (dirent const *entry = readdir(stream.get())) {
        std::string const name = entry->d_name;
        if (name.size() > 3 && name.ends_with(".so")) {
            names.push_back(name);
        }
    }
    if (errno != 0) {
        problem = systemText(errno);
    }
    std::sort(names.begin(), names.end());
    return names;
}

/// Opens one file if it may be loaded. Never waits: a FIFO or a device opens without blocking and is then refused.
Descriptor openFile(Descriptor const &directory, std::string const &name, uid_t user, std::string &problem) {
    Descriptor file(
        openat(directory.number(), name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    if (!file.isOpen()) {
        problem = errno == ELOOP ? "it is a symbolic link" : systemText(errno);
        return file;
    }
    struct stat status {};
    if (fstat(file.number(), &status) != 0) {
        problem = systemText(errno);
    } else if (!S_ISREG(status.st_mode)) {
        problem = "it is no regular file";
    } else if (std::string const found = ownershipProblem(status, user, false); !found.empty()) {
        problem = "it " + found;
    }
    return file;
}

} // namespace

Descriptor openTrustedDirectory(std::string const &path, uid_t user, std::string &problem) {
    std::unique_ptr<char, decltype(&std::free)> const canonical(realpath(path.c_str(), nullptr), &std::free);
    if (canonical == nullptr) {
        problem = systemText(errno);
        return Descriptor();
    }
    return openChecked(canonical.get(), user, problem);
}

PluginDirectory openPluginDirectory(std::string const &path, uid_t user) {
    PluginDirectory opened;
    Descriptor const directory = openTrustedDirectory(path, user, opened.problem);
    if (!directory.isOpen()) {
        return opened;
    }
    for (std::string const &name : libraryNames(directory, opened.problem)) {
        std::string problem;
        Descriptor file = openFile(directory, name, user, problem);
        if (problem.empty()) {
            opened.files.push_back({name, std::move(file)});
        } else {
            opened.skipped.push_back("plug-in '" + name + "' skipped: " + problem);
        }
    }
    return opened;
}

} // namespace Tovicli
