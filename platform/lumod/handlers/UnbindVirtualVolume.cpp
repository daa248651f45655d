// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "VolumeChange.h"

namespace Lumod {

Answer<ReplyPtr> unbindVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    VolumeName name = VolumeName::of(request.getUnbindVirtualVolume());
    return changeVolume(core, call, [&core, call, name = std::move(name)] {
        return andThen(core.volumes.find(call, name), [&core, call](FoundVolume found) {
            Orka::VirtualVolume const &volume = found.volume;
            if (volume.boundTo) {
                core.unbindTimer.defer(volume.containerId, volume.uuid);
                core.log.write(LogLevel::Info, call->trace,
                               fmt::format("the virtual volume {} waits to be unbound", volume.uuid));
            }
            return ChangedVolume{volume.uuid, volume.directoryName, volume.boundTo.value_or("")};
        });
    });
}

} // namespace Lumod
