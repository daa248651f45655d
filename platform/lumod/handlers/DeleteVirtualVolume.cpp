// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "VolumeChange.h"

namespace Lumod {

namespace {

/// Unbinds first when the volume is bound.
Answer<Done> unbindAndDelete(ProviderCalls const &calls, Orka::VirtualVolume const &volume) {
    auto unbound = volume.boundTo ? calls.unbindVirtualVolume(volume.containerId, volume.uuid)
                                  : Answer<Done>(Outcome<Done>(Done{}));
    return andThen(std::move(unbound), [calls, containerId = volume.containerId, uuid = volume.uuid](Done) {
        return calls.deleteVirtualVolume(containerId, uuid);
    });
}

Answer<ChangedVolume> deleteFound(Core &core, CallPtr const &call, FoundVolume found) {
    auto cancelled = core.unbindTimer.cancel(found.volume.uuid);
    return cancelled.then([&core, call, found = std::move(found)] {
        ProviderCalls const calls(core.services, found.provider, call);
        return andThen(unbindAndDelete(calls, found.volume), [&core, call, volume = found.volume](Done) {
            core.log.write(LogLevel::Info, call->trace, fmt::format("deleted the virtual volume {}", volume.uuid));
            return ChangedVolume{volume.uuid, volume.directoryName, {}};
        });
    });
}

} // namespace

Answer<ReplyPtr> deleteVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    VolumeName name = VolumeName::of(request.getDeleteVirtualVolume());
    return changeVolume(core, call, [&core, call, name = std::move(name)] {
        return andThen(core.volumes.find(call, name),
                       [&core, call](FoundVolume found) { return deleteFound(core, call, std::move(found)); });
    });
}

} // namespace Lumod
