// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "VolumeChange.h"

namespace Lumod {

namespace {

Orka::VolumeSpec specOf(Wire::CreateVirtualVolume::Reader request, bool modifiesProfiles) {
    Orka::VolumeSpec spec;
    spec.containerId = canonicalContainerId(request.getContainerId());
    spec.kind = Orka::VolumeKind::Config;
    spec.directoryName = textOf(request.getDirectoryName());
    requireDirectoryName(spec.directoryName);
    spec.sizeMb = request.getSizeMb();
    if (spec.sizeMb < 0) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            fmt::format("a virtual volume cannot have a size of {} MB", spec.sizeMb));
    }
    spec.profile = profileOf(textOf(request.getPolicy()), modifiesProfiles);
    spec.vmUuid = textOf(request.getVmUuid());
    return spec;
}

void requireRoom(ServedContainer const &container, Orka::VolumeSpec const &spec) {
    if (spec.sizeMb > container.facts->maxLumoSizeMb) {
        throw Wire::Failure(Wire::ErrorCode::TooLarge,
                            fmt::format("a virtual volume of {} MB is larger than the {} MB that the storage "
                                        "container '{}' allows",
                                        spec.sizeMb, container.facts->maxLumoSizeMb, container.facts->name));
    }
}

Answer<ChangedVolume> create(Core &core, CallPtr const &call, Orka::VolumeSpec spec) {
    return andThen(core.surveyor.survey(call), [&core, call, spec = std::move(spec)](Survey survey) {
        ServedContainer const &container = survey.container(spec.containerId);
        requireRoom(container, spec);
        auto created = ProviderCalls(core.services, container.provider, call).createVirtualVolume(spec);
        return andThen(std::move(created), [&core, call](Orka::VirtualVolume volume) {
            core.log.write(LogLevel::Info, call->trace,
                           fmt::format("created the virtual volume {} ('{}') in the storage container {}", volume.uuid,
                                       volume.directoryName, volume.containerId));
            return ChangedVolume{volume.uuid, volume.directoryName, volume.boundTo.value_or("")};
        });
    });
}

} // namespace

Answer<ReplyPtr> createVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Orka::VolumeSpec spec = specOf(request.getCreateVirtualVolume(), core.services.modifiesProfiles);
    return changeVolume(core, call, [&core, call, spec = std::move(spec)] { return create(core, call, spec); });
}

} // namespace Lumod
