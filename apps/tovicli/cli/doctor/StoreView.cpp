// SPDX-License-Identifier: Apache-2.0
#include "doctor/StoreView.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <fcntl.h>
#include <filesystem>
#include <stdexcept>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>

#include "wire/Paths.h"
#include "wire/UniqueFd.h"

namespace Tovicli::Cli {

namespace {

namespace fs = std::filesystem;
using Milliseconds = std::chrono::milliseconds;

constexpr char const *name = "store";
/// How long a transaction of a living process may take before it counts as left behind.
constexpr Milliseconds longestTransaction{300};

bool exists(std::string const &path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0;
}

/// Whether a journal lies beside the store and stays there.
bool isUnfinished(std::string const &store) {
    std::string const journal = store + "-journal";
    auto const limit = std::chrono::steady_clock::now() + longestTransaction;
    while (exists(journal)) {
        if (std::chrono::steady_clock::now() >= limit) {
            return true;
        }
        std::this_thread::sleep_for(Milliseconds(10));
    }
    return false;
}

/// A directory of our own, gone at the end.
class Scratch {
public:
    Scratch() {
        std::string pattern = (fs::temp_directory_path() / "tovicli-doctor.XXXXXX").string();
        if (mkdtemp(pattern.data()) == nullptr) {
            throw fs::filesystem_error("no temporary directory", pattern,
                                       std::error_code(errno, std::generic_category()));
        }
        path_ = pattern;
    }
    ~Scratch() {
        std::error_code ignored;
        fs::remove_all(path_, ignored);
    }
    Scratch(Scratch const &) = delete;
    Scratch &operator=(Scratch const &) = delete;

    std::string const &path() const {
        return path_;
    }

private:
    std::string path_;
};

StoreView read(std::string const &root, Milliseconds patience) {
    Store::HostStore store(root, Store::HostStore::Mode::QueryOnly, patience);
    store.checkIntegrity();
    return {store.providers(), store.fileSystems(), store.volumes(), store.endpointOutages()};
}

/// Copies a regular file, whatever is put in its place meanwhile: a link is not followed, a pipe not waited for.
void copyFile(std::string const &from, std::string const &to) {
    Wire::UniqueFd const file(open(from.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat status {};
    if (!file || fstat(file.get(), &status) != 0) {
        throw fs::filesystem_error("cannot copy", from, std::error_code(errno, std::generic_category()));
    }
    if (!S_ISREG(status.st_mode)) {
        throw std::runtime_error("'" + from + "' is no regular file");
    }
    fs::copy_file("/proc/self/fd/" + std::to_string(file.get()), to);
}

StoreView readCopy(std::string const &root, Milliseconds patience) {
    Scratch const scratch;
    std::string const store = Wire::Paths(root).hostStore();
    std::string const copy = Wire::Paths(scratch.path()).hostStore();
    copyFile(store, copy);
    copyFile(store + "-journal", copy + "-journal");
    return read(scratch.path(), patience);
}

std::string counted(std::size_t count, char const *one, char const *many) {
    return std::to_string(count) + " " + (count == 1 ? one : many);
}

} // namespace

std::optional<StoreView> checkStore(std::string const &root, Milliseconds patience, Report &report) {
    std::string const path = Wire::Paths(root).hostStore();
    struct stat status {};
    if (stat(path.c_str(), &status) != 0) {
        int const reason = errno;
        if (reason != ENOENT) {
            report.fail(name, "'" + path + "' cannot be looked at: " + std::strerror(reason));
            return std::nullopt;
        }
        report.warn(name, "'" + path + "' does not exist: no provider is registered");
        return StoreView();
    }
    try {
        auto const isHere = [](Store::Volume const &volume) { return volume.state != Store::VolumeState::Removing; };
        bool const unfinished = isUnfinished(path);
        StoreView view = unfinished ? readCopy(root, patience) : read(root, patience);
        auto const volumes = static_cast<std::size_t>(std::count_if(view.volumes.begin(), view.volumes.end(), isHere));
        if (unfinished) {
            report.warn(name, "'" + path +
                                  "' holds an unfinished transaction of a process that was ended; the next "
                                  "command undoes it");
        } else if (access(path.c_str(), W_OK) != 0) {
            report.warn(name, "'" + path + "' is sound, but this user cannot write it");
        } else {
            report.ok(name, "'" + path + "' is sound: " + counted(view.providers.size(), "provider", "providers") +
                                ", " + counted(view.fileSystems.size(), "mounted container", "mounted containers") +
                                ", " + counted(volumes, "config volume", "config volumes"));
        }
        return view;
    } catch (std::exception const &failure) {
        report.fail(name, failure.what());
        return std::nullopt;
    }
}

} // namespace Tovicli::Cli
