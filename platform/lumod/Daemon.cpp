// SPDX-License-Identifier: Apache-2.0
#include "lumod/Daemon.h"

#include <utility>

#include <fmt/format.h>

#include "Core.h"

namespace Lumod {

Core::Core(Settings settingsGiven, Surroundings surroundings)
    : settings(std::move(settingsGiven))
    , log(surroundings.log)
    , timer(surroundings.timer)
    , started(timer.now())
    , faults(timer)
    , providers(std::move(surroundings.makeProvider))
    , host(settings.root, timer, log,
           [this](HostSnapshot const &snapshot) {
               outages.setStored(snapshot.endpointOutages);
               providers.apply(snapshot.providers);
           })
    , services{timer, log, std::move(surroundings.newKey), tasks, host, providers, faults, outages}
    , surveyor(services)
    , volumes(services, surveyor)
    , unbindTimer(timer, tasks, settings.unbindPeriod,
                  [this](CallPtr const &call, std::string const &containerId, std::string const &uuid) {
                      return unbind(call, containerId, uuid);
                  })
    , tasks(*this) {}

void Core::taskFailed(kj::Exception &&exception) {
    log.write(LogLevel::Error, "-", fmt::format("a task broke: {}", exception.getDescription().cStr()));
}

Answer<Done> Core::unbind(CallPtr const &call, std::string const &containerId, std::string const &uuid) {
    auto unbound = andThen(volumes.find(call, {containerId, uuid, {}}), [this, call](FoundVolume found) {
        return ProviderCalls(services, found.provider, call)
            .unbindVirtualVolume(found.volume.containerId, found.volume.uuid);
    });
    return whateverCame(std::move(unbound), [this, call, uuid](Outcome<Done> outcome) -> Outcome<Done> {
        if (outcome.ok()) {
            log.write(LogLevel::Info, call->trace, fmt::format("unbound the virtual volume {}", uuid));
            return outcome;
        }
        bool const isGone = outcome.failure().code() == Wire::ErrorCode::NoSuchVolume ||
                            outcome.failure().code() == Wire::ErrorCode::NoSuchContainer;
        log.write(isGone ? LogLevel::Info : LogLevel::Warning, call->trace,
                  fmt::format("the virtual volume {} was not unbound: {}", uuid, outcome.failure().sentence()));
        return isGone ? Outcome<Done>(Done{}) : outcome;
    });
}

Daemon::Daemon(Settings settings, Surroundings surroundings)
    : core_(std::make_unique<Core>(std::move(settings), std::move(surroundings))) {}

Daemon::~Daemon() = default;

} // namespace Lumod
