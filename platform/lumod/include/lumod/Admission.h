// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <vector>

#include <sys/types.h>

namespace Lumod {

/// Who connected, as the kernel tells it.
struct Peer {
    uid_t uid = static_cast<uid_t>(-1);
    gid_t gid = static_cast<gid_t>(-1);
    pid_t pid = 0;
    std::vector<gid_t> groups; ///< supplementary
};

/// Who may connect: root, the daemon's own user, and the members of one group if there is one.
struct Admission {
    uid_t ownUid = 0;
    std::optional<gid_t> group;

    bool admits(Peer const &peer) const;
};

/// @return nothing when the kernel does not tell
std::optional<Peer> peerOf(int socket);

} // namespace Lumod
