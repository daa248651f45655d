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

/// Rules for the file itself: there, of the right name, regular, nobody else's.
void checkEntry(std::string const &file, std::vector<Finding> &findings) {
    std::string const name = nameOf(file);
    if (name.size() <= 3 || !name.ends_with(".so")) {
        findings.push_back({"file", "its name does not end in .so; nothing else of a plug-in directory is looked at"});
    }
    struct stat status {};
    if (lstat(file.c_str(), &status) != 0) {
        findings.push_back({"file", std::strerror(errno)});
        return;
    }
    if (S_ISLNK(status.st_mode)) {
        findings.push_back({"file", "it is a symbolic link"});
        return;
    }
    if (!S_ISREG(status.st_mode)) {
        findings.push_back({"file", "it is no regular file"});
        return;
    }
    if (status.st_uid != 0 && status.st_uid != geteuid()) {
        findings.push_back({"permissions", "it belongs to neither root nor the user"});
    }
    if ((status.st_mode & (S_IWGRP | S_IWOTH)) != 0) {
        findings.push_back({"permissions", "it can be written by others"});
    }
    if (access(file.c_str(), R_OK) != 0) {
        findings.push_back({"permissions", "it cannot be read: " + std::string(std::strerror(errno))});
    }
    if (std::string const problem = openPluginDirectory(directoryOf(file), geteuid()).problem; !problem.empty()) {
        findings.push_back({"permissions", "its directory: " + problem});
    }
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

std::vector<Finding> inspectFile(std::string const &file) {
    std::vector<Finding> findings;
    checkEntry(file, findings);
    Descriptor const opened(open(file.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat status {};
    if (!opened.isOpen() || fstat(opened.number(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return findings;
    }
    checkElf(opened.number(), findings);
    if (readElfFile(opened.number()).problem.empty()) {
        std::vector<Symbol> const symbols = dynamicSymbols(opened.number());
        bool hasEntry = false;
        for (Symbol const &symbol : symbols) {
            hasEntry = hasEntry || (symbol.defined && symbol.name == "AutoCli_RegisterNamespaces");
        }
        if (!hasEntry) {
            findings.push_back({"entry point", "it has no entry point AutoCli_RegisterNamespaces"});
        }
    }
    return findings;
}

std::vector<Finding> inspect(Question const &question) {
    std::vector<Finding> findings = inspectFile(question.file);
    return findings.empty() ? tryOut(question) : findings;
}

} // namespace Tovicli::Cli
