// SPDX-License-Identifier: Apache-2.0
#include "ProviderCalls.h"

#include <utility>

#include <fmt/format.h>

#include "Broken.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

bool isChange(Operation operation) {
    return operation == Operation::CreateVirtualVolume || operation == Operation::DeleteVirtualVolume ||
           operation == Operation::BindVirtualVolume || operation == Operation::UnbindVirtualVolume;
}

} // namespace

std::optional<Failure> ProviderCalls::hindrance(Operation operation) const {
    std::string const &name = entry_->record.name;
    if (entry_->isOffline()) {
        return Failure(ErrorCode::ProviderOffline, fmt::format("the provider '{}' is offline (injected)", name));
    }
    if (entry_->injected == ProviderStatus::SyncError && isChange(operation)) {
        return Failure(ErrorCode::ProviderBusy,
                       fmt::format("the provider '{}' is out of sync (injected) and takes no changes", name));
    }
    if (entry_->unusable) {
        return entry_->unusable;
    }
    return services_.faults.strike(operation, name);
}

Orka::CallContext ProviderCalls::contextFor(Operation operation) const {
    Orka::CallContext context{call_->deadline, std::nullopt, {}};
    if (auto const snapshot = services_.host.lastKnown()) {
        context.orkaContext = snapshot->orkaContext;
    }
    if (isChange(operation)) {
        context.idempotencyKey = services_.newKey();
    }
    return context;
}

template <typename T, typename Function>
Answer<T> ProviderCalls::perform(Operation operation, Function &&function) const {
    using Result = Outcome<T>;
    if (auto failure = hindrance(operation)) {
        services_.log.write(LogLevel::Warning, call_->trace, failure->sentence());
        return Result(*std::move(failure));
    }
    Log &log = services_.log;
    if (log.shows(LogLevel::Trivia)) {
        log.write(LogLevel::Trivia, call_->trace,
                  fmt::format("{} of provider '{}'", nameOf(operation), entry_->record.name));
    }
    auto promise = attempt([&] { return function(*entry_->provider, contextFor(operation)); });
    return promise
        .catch_([operation, entry = entry_](kj::Exception &&exception) -> Result {
            return brokenBy(exception, fmt::format("{} of provider '{}' broke", nameOf(operation), entry->record.name));
        })
        .then([operation, entry = entry_, call = call_, &log](Result &&result) -> Result {
            if (!result.ok()) {
                log.write(LogLevel::Verbose, call->trace,
                          fmt::format("{} of provider '{}' failed: {}", nameOf(operation), entry->record.name,
                                      result.failure().sentence()));
            }
            return std::move(result);
        });
}

Answer<Orka::Listing<Orka::StorageArray>> ProviderCalls::queryStorageArray() const {
    return perform<Orka::Listing<Orka::StorageArray>>(Operation::QueryStorageArray,
                                                      [](Orka::Provider &provider, Orka::CallContext context) {
                                                          return provider.queryStorageArray(std::move(context));
                                                      });
}

Answer<Orka::Listing<Orka::StorageContainer>> ProviderCalls::queryStorageContainer() const {
    return perform<Orka::Listing<Orka::StorageContainer>>(Operation::QueryStorageContainer,
                                                          [](Orka::Provider &provider, Orka::CallContext context) {
                                                              return provider.queryStorageContainer(std::move(context));
                                                          });
}

Answer<Orka::VirtualVolume> ProviderCalls::createVirtualVolume(Orka::VolumeSpec spec) const {
    return perform<Orka::VirtualVolume>(Operation::CreateVirtualVolume,
                                        [&spec](Orka::Provider &provider, Orka::CallContext context) {
                                            return provider.createVirtualVolume(std::move(context), std::move(spec));
                                        });
}

Answer<Done> ProviderCalls::deleteVirtualVolume(std::string containerId, std::string uuid) const {
    return perform<Done>(Operation::DeleteVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
        return provider.deleteVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    });
}

Answer<Done> ProviderCalls::bindVirtualVolume(std::string containerId, std::string uuid, std::string endpoint) const {
    return perform<Done>(Operation::BindVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
        return provider.bindVirtualVolume(std::move(context), std::move(containerId), std::move(uuid),
                                          std::move(endpoint));
    });
}

Answer<Done> ProviderCalls::unbindVirtualVolume(std::string containerId, std::string uuid) const {
    return perform<Done>(Operation::UnbindVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
        return provider.unbindVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
    });
}

Answer<Orka::VirtualVolume> ProviderCalls::queryVirtualVolume(std::string containerId, std::string uuid) const {
    return perform<Orka::VirtualVolume>(
        Operation::QueryVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.queryVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
        });
}

Answer<std::vector<Orka::ConfigVolume>> ProviderCalls::queryVirtualVolumesOfContainer(std::string containerId,
                                                                                      int64_t max) const {
    return perform<std::vector<Orka::ConfigVolume>>(
        Operation::QueryVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.queryVirtualVolumesOfContainer(std::move(context), std::move(containerId), max);
        });
}

Answer<std::vector<Orka::VolumePresence>> ProviderCalls::queryVirtualVolumesById(std::string containerId,
                                                                                 std::vector<std::string> uuids) const {
    return perform<std::vector<Orka::VolumePresence>>(
        Operation::QueryVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.queryVirtualVolumesById(std::move(context), std::move(containerId), std::move(uuids));
        });
}

Answer<std::optional<Orka::VirtualVolume>>
ProviderCalls::queryVirtualVolumeByDirectoryName(std::string containerId, std::string directoryName) const {
    return perform<std::optional<Orka::VirtualVolume>>(
        Operation::QueryVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.queryVirtualVolumeByDirectoryName(std::move(context), std::move(containerId),
                                                              std::move(directoryName));
        });
}

Answer<Orka::SpaceStats> ProviderCalls::spaceStatsForVirtualVolume(std::string containerId, std::string uuid) const {
    return perform<Orka::SpaceStats>(
        Operation::SpaceStatsForVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.spaceStatsForVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
        });
}

Answer<Orka::UnsharedChunks> ProviderCalls::unsharedChunksVirtualVolume(std::string containerId,
                                                                        std::string uuid) const {
    return perform<Orka::UnsharedChunks>(
        Operation::UnsharedChunksVirtualVolume, [&](Orka::Provider &provider, Orka::CallContext context) {
            return provider.unsharedChunksVirtualVolume(std::move(context), std::move(containerId), std::move(uuid));
        });
}

Answer<Orka::Metadata> ProviderCalls::getMetadata(std::string containerId, std::string uuid) const {
    return perform<Orka::Metadata>(Operation::GetMetadata, [&](Orka::Provider &provider, Orka::CallContext context) {
        return provider.getMetadata(std::move(context), std::move(containerId), std::move(uuid));
    });
}

Answer<Done> ProviderCalls::setContext() const {
    return perform<Done>(Operation::SetContext, [](Orka::Provider &provider, Orka::CallContext context) {
        return provider.setContext(std::move(context));
    });
}

} // namespace Lumod
