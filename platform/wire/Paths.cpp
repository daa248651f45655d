// SPDX-License-Identifier: Apache-2.0
#include "wire/Paths.h"

#include <cstdlib>
#include <utility>

namespace Wire {

Paths::Paths(std::string root)
    : root_(std::move(root)) {
    while (!root_.empty() && root_.back() == '/') {
        root_.pop_back();
    }
}

std::string Paths::hostStore() const {
    return root_ + "/host.db";
}

std::string Paths::volumes() const {
    return root_ + "/volumes";
}

std::string Paths::lumos() const {
    return root_ + "/lumos";
}

std::string Paths::arrays() const {
    return root_ + "/arrays";
}

std::string Paths::certificates() const {
    return root_ + "/certs";
}

std::string Paths::run() const {
    return root_ + "/run";
}

std::string Paths::orderedSocket() const {
    return root_ + "/run/lumod.sock";
}

std::string Paths::prioritySocket() const {
    return root_ + "/run/lumod-priority.sock";
}

std::string Paths::lockFile() const {
    return root_ + "/run/lumod.lock";
}

std::string Paths::pidFile() const {
    return root_ + "/run/lumod.pid";
}

std::string Paths::logs() const {
    return root_ + "/log";
}

std::string Paths::logFile() const {
    return root_ + "/log/lumod.log";
}

std::string rootFromEnvironment() {
    char const *root = secure_getenv("TOVI_ROOT");
    return root != nullptr && *root != '\0' ? root : "/var/lib/tovi";
}

} // namespace Wire
