// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace Wire {

/// Where everything of one host lies, told from its root directory. Names files; opens and creates none.
class Paths {
public:
    /// @param root a directory; trailing slashes do not count
    explicit Paths(std::string root);

    std::string const &root() const {
        return root_;
    }
    std::string hostStore() const;
    /// The directory of mounted containers; a container's directory stands below it.
    std::string volumes() const;
    /// Content of config volumes while they are not mounted, one directory a volume.
    std::string lumos() const;
    std::string arrays() const;
    /// The directory of certificates that are pinned for providers.
    std::string certificates() const;
    /// The directory of sockets, lock file and pid file.
    std::string run() const;
    std::string orderedSocket() const;
    std::string prioritySocket() const;
    std::string lockFile() const;
    std::string pidFile() const;
    /// The directory of the log file.
    std::string logs() const;
    std::string logFile() const;

private:
    std::string root_;
};

/// @return TOVI_ROOT, or /var/lib/tovi when it is unset, empty, or the process runs with rights that its caller lacks
std::string rootFromEnvironment();

} // namespace Wire
