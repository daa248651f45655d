// SPDX-License-Identifier: Apache-2.0
#include "doctor/Directories.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <map>
#include <memory>
#include <set>
#include <sys/stat.h>
#include <unistd.h>

#include "wire/Paths.h"

namespace Tovicli::Cli {

namespace {

bool isDirectory(std::string const &path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

bool isThere(std::string const &path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0;
}

/// Names in a directory, hidden ones left out, sorted; none when it cannot be read.
std::vector<std::string> namesIn(std::string const &path) {
    auto const closeStream = [](DIR *stream) { closedir(stream); };
    std::unique_ptr<DIR, decltype(closeStream)> const stream(opendir(path.c_str()), closeStream);
    std::vector<std::string> names;
    while (dirent const *entry = stream != nullptr ? readdir(stream.get()) : nullptr) {
        if (entry->d_name[0] != '.') {
            names.emplace_back(entry->d_name);
        }
    }
    std::sort(names.begin(), names.end());
    return names;
}

/// The mounts of one host: rows for what is wrong, one row for all that is well.
class Mounts {
public:
    Mounts(std::string const &root, StoreView const &view, Report &report)
        : paths_(root)
        , view_(view)
        , report_(report) {
        for (Store::FileSystem const &fileSystem : view.fileSystems) {
            containerNames_[fileSystem.containerId] = fileSystem.name;
        }
    }

    void check() {
        for (Store::FileSystem const &fileSystem : view_.fileSystems) {
            checkContainer(fileSystem);
        }
        for (Store::Volume const &volume : view_.volumes) {
            checkVolume(volume);
        }
        checkStrays();
        if (!wrong_) {
            report_.ok("mounts", std::to_string(view_.fileSystems.size()) + " containers and " +
                                     std::to_string(mountedVolumes_) + " config volumes are where their records say");
        }
    }

private:
    void warn(std::string const &name, std::string const &detail) {
        wrong_ = true;
        report_.warn(name, detail);
    }
    void fail(std::string const &name, std::string const &detail) {
        wrong_ = true;
        report_.fail(name, detail);
    }

    void checkContainer(Store::FileSystem const &fileSystem) {
        std::string const path = paths_.volumes() + "/" + fileSystem.name;
        if (isDirectory(path)) {
            return;
        }
        std::string const name = "mount " + fileSystem.name;
        if (isThere(path)) {
            fail(name, "'" + path + "' is in the place of its directory and is none");
        } else {
            fail(name, "its directory '" + path + "' is missing; the next mount in it makes it anew");
        }
    }

    /// A record is on its way until a later change settles it, so what counts is where the directory is.
    void checkVolume(Store::Volume const &volume) {
        std::string const container = containerNames_[volume.containerId];
        std::string const mounted = paths_.volumes() + "/" + container + "/" + volume.directoryName;
        bool const isPutAway = isDirectory(paths_.lumos() + "/" + volume.uuid);
        std::string const name = "config volume " + container + "/" + volume.directoryName;
        switch (volume.state) {
        case Store::VolumeState::Mounted:
        case Store::VolumeState::Mounting:
            ++mountedVolumes_;
            if (isDirectory(mounted)) {
                break;
            }
            if (volume.state == Store::VolumeState::Mounting && isPutAway) {
                warn(name, "its mount was cut off; the next mount or unmount of any volume finishes it");
            } else {
                fail(name, "it is mounted, but its directory '" + mounted + "' is missing");
            }
            break;
        case Store::VolumeState::Unmounting:
            if (isDirectory(mounted) && !isPutAway) {
                warn(name, "its unmount was cut off; the next mount or unmount of any volume finishes it");
            }
            break;
        case Store::VolumeState::Removing:
            if (isPutAway) {
                warn(name, "its removal was cut off; removing it again finishes it");
            }
            break;
        case Store::VolumeState::Unmounted:
            break; // its content is put away, if it ever had any
        }
    }

    void checkStrays() {
        std::set<std::string> known;
        for (Store::FileSystem const &fileSystem : view_.fileSystems) {
            known.insert(fileSystem.name);
        }
        for (std::string const &name : namesIn(paths_.volumes())) {
            if (!known.contains(name)) {
                warn("directory " + name, "'" + paths_.volumes() + "/" + name +
                                              "' has no record: no container of that "
                                              "name is mounted");
            }
        }
        checkStrayVolumes();
        std::set<std::string> uuids;
        for (Store::Volume const &volume : view_.volumes) {
            uuids.insert(volume.uuid);
        }
        for (std::string const &uuid : namesIn(paths_.lumos())) {
            if (!uuids.contains(uuid)) {
                warn("directory " + uuid, "'" + paths_.lumos() + "/" + uuid +
                                              "' has no record: it belongs to no config "
                                              "volume that this host knows");
            }
        }
    }

    void checkStrayVolumes() {
        std::map<std::string, std::set<std::string>> recorded;
        for (Store::Volume const &volume : view_.volumes) {
            recorded[volume.containerId].insert(volume.directoryName);
        }
        for (Store::FileSystem const &fileSystem : view_.fileSystems) {
            std::string const directory = paths_.volumes() + "/" + fileSystem.name;
            std::set<std::string> const &known = recorded[fileSystem.containerId];
            for (std::string const &name : namesIn(directory)) {
                if (!known.contains(name)) {
                    warn("directory " + fileSystem.name + "/" + name,
                         "'" + directory + "/" + name + "' has no record: it is no config volume's");
                }
            }
        }
    }

    Wire::Paths const paths_;
    StoreView const &view_;
    Report &report_;
    std::map<std::string, std::string> containerNames_;
    std::size_t mountedVolumes_ = 0;
    bool wrong_ = false;
};

} // namespace

bool checkRoot(std::string const &root, Report &report) {
    struct stat status {};
    if (stat(root.c_str(), &status) != 0) {
        report.fail("root", "'" + root + "' cannot be used: " + std::strerror(errno));
        return false;
    }
    if (!S_ISDIR(status.st_mode)) {
        report.fail("root", "'" + root + "' is no directory");
        return false;
    }
    if (access(root.c_str(), R_OK | X_OK) != 0) {
        report.fail("root", "this user cannot look into '" + root + "': " + std::strerror(errno));
        return false;
    }
    if (access(root.c_str(), W_OK) != 0) {
        report.warn("root", "this user cannot change anything in '" + root + "': " + std::strerror(errno));
    } else if ((status.st_mode & S_IWOTH) != 0) {
        report.warn("root", "'" + root + "' can be written by everybody");
    } else {
        report.ok("root", "'" + root + "'");
    }
    return true;
}

void checkMounts(std::string const &root, StoreView const &view, Report &report) {
    Mounts(root, view, report).check();
}

} // namespace Tovicli::Cli
