// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

Answer<ReplyPtr> spaceStatsForLumo(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    auto stats = core.volumes.askAbout<Orka::SpaceStats>(
        call, VolumeName::of(request.getSpaceStatsForLumo()),
        [containerId = canonicalContainerId(request.getSpaceStatsForLumo().getContainerId())](
            ProviderCalls const &calls, std::string const &uuid) {
            return calls.spaceStatsForVirtualVolume(containerId, uuid);
        });
    return andThen(std::move(stats), [](Orka::SpaceStats found) {
        return singleReply([found](Wire::Reply::Builder reply) {
            Wire::SpaceStats::Builder builder = reply.initSpaceStats();
            builder.setLogicalSizeMb(found.logicalMb);
            builder.setCommittedSizeMb(found.committedMb);
            builder.setUnsharedSizeMb(found.unsharedMb.value_or(0));
            builder.setUnsharedSizeValid(found.unsharedMb.has_value());
        });
    });
}

} // namespace Lumod
