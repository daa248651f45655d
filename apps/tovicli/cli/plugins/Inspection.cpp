// SPDX-License-Identifier: Apache-2.0
#include "plugins/Inspection.h"

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

#include "Descriptor.h"
#include "ElfFile.h"
#include "PlatformLibraries.h"
#include "PluginDirectory.h"
#include "plugins/Identity.h"
#include "plugins/Trial.h"

namespace Tovicli::Cli {

namespace {

std::string nameOf(std::string const &path) {
    return path.substr(path.rfind('/') + 1);
}

std::string directoryOf(std::string const &path) {
    std::size_t const slash = path.rfind('/');
    return slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

/// Where a file is looked for.
struct Place {
    int directory;
    std::string name;
};

/// Rules for the file itself: there, of the right name, regular, nobody else's.
/// @return whether it is a file at all
bool checkEntry(Place const &place, std::vector<Finding> &findings) {
    std::string const name = nameOf(place.name);
    if (name.size() <= 3 || !name.ends_with(".so")) {
        findings.push_back({"file", "its name does not end in .so; nothing else of a plug-in directory is looked at"});
    }
    struct stat status {};
    if (fstatat(place.directory, place.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
        findings.push_back({"file", std::strerror(errno)});
        return false;
    }
    if (S_ISLNK(status.st_mode)) {
        findings.push_back({"file", "it is a symbolic link"});
        return false;
    }
    if (!S_ISREG(status.st_mode)) {
        findings.push_back({"file", "it is no regular file"});
        return false;
    }
    if (status.st_uid != 0 && status.st_uid != geteuid()) {
        findings.push_back({"permissions", "it belongs to neither root nor the user"});
    }
    if ((status.st_mode & (S_IWGRP | S_IWOTH)) != 0) {
        findings.push_back({"permissions", "it can be written by others"});
    }
    if (faccessat(place.directory, place.name.c_str(), R_OK, 0) != 0) {
        findings.push_back({"permissions", "it cannot be read: " + std::string(std::strerror(errno))});
    }
    return true;
}

/// Rules for what the file says of itself. @return what it needs; nothing when it cannot be read that far
std::vector<std::string> checkElf(int descriptor, std::vector<Finding> &findings) {
    Identity const identity = identityOf(descriptor);
    for (Finding const &difference : identity.differences) {
        findings.push_back(difference);
    }
    ElfFile elf = readElfFile(descriptor);
    if (identity.differences.empty() && !elf.problem.empty()) {
        findings.push_back({"elf", elf.problem});
    }
    for (std::string const &name : elf.needed) {
        if (char const *const ours = ourVersionOf(name); ours != nullptr && name != ours) {
            findings.push_back({"abi", "it was built against " + name + ", this tool has " + ours});
        }
    }
    return elf.needed;
}

} // namespace

std::string abiOf(std::string const &file) {
    Descriptor const opened(open(file.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    std::string abi;
    if (opened.isOpen()) {
        for (std::string const &name : readElfFile(opened.number()).needed) {
            if (ourVersionOf(name) != nullptr) {
                abi += (abi.empty() ? "" : " ") + name;
            }
        }
    }
    return abi;
}

Inspected inspectFile(std::string const &file) {
    Inspected inspected;
    std::vector<Finding> &findings = inspected.findings;
    std::string directoryProblem;
    Descriptor const directory = openTrustedDirectory(directoryOf(file), geteuid(), directoryProblem);
    // A file of a directory that is not trusted is looked at all the same, by its path: it is never loaded.
    Place const place = directory.isOpen() ? Place{directory.number(), nameOf(file)} : Place{AT_FDCWD, file};
    bool const isFile = checkEntry(place, findings);
    if (isFile && !directoryProblem.empty()) {
        findings.push_back({"permissions", "its directory: " + directoryProblem});
    }
    inspected.file = Descriptor(
        openat(place.directory, place.name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    int const opened = inspected.file.number();
    struct stat status {};
    if (!inspected.file.isOpen() || fstat(opened, &status) != 0 || !S_ISREG(status.st_mode)) {
        return inspected;
    }
    checkElf(opened, findings);
    if (readElfFile(opened).problem.empty()) {
        std::vector<Symbol> const symbols = dynamicSymbols(opened);
        bool hasEntry = false;
        for (Symbol const &symbol : symbols) {
            hasEntry = hasEntry || (symbol.defined && symbol.name == "AutoCli_RegisterNamespaces");
        }
        if (!hasEntry) {
            findings.push_back({"entry point", "it has no entry point AutoCli_RegisterNamespaces"});
        }
    }
    return inspected;
}

std::vector<Finding> inspect(Question const &question) {
    Inspected inspected = inspectFile(question.file);
    return inspected.findings.empty() ? tryOut(question, inspected.file) : std::move(inspected.findings);
}

} // namespace Tovicli::Cli
