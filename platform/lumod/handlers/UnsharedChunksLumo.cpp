// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

Answer<ReplyPtr> unsharedChunksLumo(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    auto chunks = core.volumes.askAbout<Orka::UnsharedChunks>(
        call, VolumeName::of(request.getUnsharedChunksLumo()),
        [containerId = canonicalContainerId(request.getUnsharedChunksLumo().getContainerId())](
            ProviderCalls const &calls, std::string const &uuid) {
            return calls.unsharedChunksVirtualVolume(containerId, uuid);
        });
    return andThen(std::move(chunks), [](Orka::UnsharedChunks found) {
        return singleReply([found = std::move(found)](Wire::Reply::Builder reply) {
            Wire::UnsharedChunks::Builder builder = reply.initUnsharedChunks();
            builder.setBlockSize(found.blockSize);
            builder.setBitmap(kj::arrayPtr(found.bitmap.data(), found.bitmap.size()));
        });
    });
}

} // namespace Lumod
