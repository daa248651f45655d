// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <algorithm>

#include <fmt/format.h>

#include "Endpoints.h"
#include "VolumeChange.h"

namespace Lumod {

namespace {

using Wire::ErrorCode;
using Wire::Failure;

/// One volume on its way to an endpoint. Shared by the steps.
struct Binding {
    Core &core;
    CallPtr call;
    FoundVolume found;
    std::vector<std::string_view> candidates; ///< usable endpoints, the best first

    ProviderCalls calls() const {
        return ProviderCalls(core.services, found.provider, call);
    }
    ChangedVolume boundTo(std::string_view endpoint) const {
        return {found.volume.uuid, found.volume.directoryName, std::string(endpoint)};
    }
};
using BindingPtr = std::shared_ptr<Binding const>;

Failure noEndpoint(Binding const &binding) {
    return Failure(ErrorCode::NoAccessibleEndpoint,
                   fmt::format("the virtual volume {} cannot be bound: no protocol endpoint of the storage container "
                               "{} is accessible",
                               binding.found.volume.uuid, binding.found.volume.containerId));
}

/// An endpoint may have become inaccessible since the array told of it; then the next one is tried.
Answer<ChangedVolume> bindFrom(BindingPtr const &binding, std::size_t at) {
    if (at == binding->candidates.size()) {
        throw noEndpoint(*binding);
    }
    Orka::VirtualVolume const &volume = binding->found.volume;
    std::string_view const endpoint = binding->candidates[at];
    auto bound = binding->calls().bindVirtualVolume(volume.containerId, volume.uuid, std::string(endpoint));
    return whateverCame(std::move(bound), [binding, at, endpoint](Outcome<Done> outcome) -> Answer<ChangedVolume> {
        if (!outcome.ok() && outcome.failure().code() == ErrorCode::NoAccessibleEndpoint) {
            return bindFrom(binding, at + 1);
        }
        if (!outcome.ok()) {
            return Outcome<ChangedVolume>(outcome.failure());
        }
        binding->core.log.write(LogLevel::Info, binding->call->trace,
                                fmt::format("bound the virtual volume {} to the protocol endpoint {}",
                                            binding->found.volume.uuid, endpoint));
        return Outcome<ChangedVolume>(binding->boundTo(endpoint));
    });
}

Answer<ChangedVolume> bindAnew(BindingPtr const &binding) {
    std::optional<std::string> const &current = binding->found.volume.boundTo;
    if (binding->candidates.empty()) {
        throw noEndpoint(*binding);
    }
    if (!current) {
        return bindFrom(binding, 0);
    }
    if (std::find(binding->candidates.begin(), binding->candidates.end(), *current) != binding->candidates.end()) {
        return Outcome<ChangedVolume>(binding->boundTo(*current));
    }
    binding->core.log.write(LogLevel::Info, binding->call->trace,
                            fmt::format("the virtual volume {} is bound to the protocol endpoint {}, which cannot be "
                                        "used; it gets another one",
                                        binding->found.volume.uuid, *current));
    auto unbound = binding->calls().unbindVirtualVolume(binding->found.volume.containerId, binding->found.volume.uuid);
    return andThen(std::move(unbound), [binding](Done) { return bindFrom(binding, 0); });
}

Answer<ChangedVolume> bind(Core &core, CallPtr const &call, VolumeName const &name) {
    uint64_t const endedBefore = core.unbindTimer.ended();
    return andThen(core.volumes.find(call, name), [&core, call, endedBefore](FoundVolume found) {
        // From here on the timer leaves the volume alone; whoever unbinds it already finishes first.
        auto settled = core.unbindTimer.cancel(found.volume.uuid);
        return settled.then([&core, call, endedBefore, found = std::move(found)]() mutable {
            if (core.unbindTimer.ended() != endedBefore) {
                return bind(core, call, {found.volume.containerId, found.volume.uuid, {}});
            }
            return attempt([&] {
                ServedContainer const &container = found.survey.container(found.volume.containerId);
                auto candidates = usableEndpoints(*found.survey.view, container, found.provider, core.outages);
                return bindAnew(
                    std::make_shared<Binding const>(Binding{core, call, std::move(found), std::move(candidates)}));
            });
        });
    });
}

} // namespace

Answer<ReplyPtr> bindVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    VolumeName name = VolumeName::of(request.getBindVirtualVolume());
    return changeVolume(core, call, [&core, call, name = std::move(name)] { return bind(core, call, name); });
}

} // namespace Lumod
