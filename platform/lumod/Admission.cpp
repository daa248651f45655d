// SPDX-License-Identifier: Apache-2.0
#include "lumod/Admission.h"

#include <algorithm>

#include <sys/socket.h>

namespace Lumod {

bool Admission::admits(Peer const &peer) const {
    if (peer.uid == 0 || peer.uid == ownUid) {
        return true;
    }
    return group &&
           (peer.gid == *group || std::find(peer.groups.begin(), peer.groups.end(), *group) != peer.groups.end());
}

std::optional<Peer> peerOf(int socket) {
    ucred credentials{};
    socklen_t size = sizeof credentials;
    if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &credentials, &size) != 0) {
        return std::nullopt;
    }
    Peer peer{credentials.uid, credentials.gid, credentials.pid, {}};
    socklen_t bytes = 0;
    // Asked without room, the kernel tells how much it needs.
    ::getsockopt(socket, SOL_SOCKET, SO_PEERGROUPS, nullptr, &bytes);
    peer.groups.resize(bytes / sizeof(gid_t));
    if (bytes > 0 && ::getsockopt(socket, SOL_SOCKET, SO_PEERGROUPS, peer.groups.data(), &bytes) != 0) {
        peer.groups.clear();
    }
    return peer;
}

} // namespace Lumod
