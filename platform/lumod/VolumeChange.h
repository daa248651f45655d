// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>

#include "Core.h"
#include "ReplySource.h"

namespace Lumod {

/// A volume as it is, or was, when a change of it is done.
struct ChangedVolume {
    std::string uuid;
    std::string directoryName;
    std::string endpoint; ///< empty: unbound
};

inline ReplyPtr volumeReply(ChangedVolume volume) {
    return singleReply([volume = std::move(volume)](Wire::Reply::Builder reply) {
        Wire::Volume::Builder builder = reply.initVolume();
        builder.setUuid(volume.uuid.c_str());
        builder.setDirectoryName(volume.directoryName.c_str());
        builder.setEndpoint(volume.endpoint.c_str());
    });
}

/// Runs a change of a volume: in its turn, or at once when the request came over the priority socket.
template <typename Function>
Answer<ReplyPtr> changeVolume(Core &core, CallPtr const &call, Function change) {
    auto changed = call->ordered ? core.mutations.inTurn(std::move(change)) : change();
    return andThen(std::move(changed), [](ChangedVolume volume) { return volumeReply(std::move(volume)); });
}

} // namespace Lumod
