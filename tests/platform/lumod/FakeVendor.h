// SPDX-License-Identifier: Apache-2.0
//
// A vendor's world in memory: arrays, containers and volumes as plain members that a test sets, a record of every
// operation, and three ways to misbehave: operations that fail, that are answered only when the test says so, and lists
// that change.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include <fmt/format.h>
#include <kj/async.h>

#include "orka/Provider.h"

namespace LumodTest {

struct FakeVendor {
    std::vector<Orka::StorageArray> arrays;
    std::vector<Orka::StorageContainer> containers;
    std::map<std::string, Orka::VirtualVolume> volumes; ///< by uuid
    uint64_t version = 1;

    std::vector<std::string> calls; ///< "operation argument ..."
    std::vector<Orka::CallContext> contexts;
    std::map<std::string, Wire::Failure> failing; ///< by operation
    std::function<void()> breaks;                 ///< called by every operation; throws what no provider should
    bool swallowsAnswers = false;                 ///< tells of one volume less than it was asked about
    std::set<std::string> hanging;                ///< operations that wait for answer()
    std::vector<kj::Own<kj::PromiseFulfiller<void>>> held;

    /// Lets everything that hangs go on.
    void answer() {
        auto all = kj::mv(held);
        held.clear();
        for (auto &fulfiller : all) {
            fulfiller->fulfill();
        }
    }
    /// How often an operation was asked for.
    int count(std::string const &operation) const {
        int found = 0;
        for (std::string const &call : calls) {
            found += call.compare(0, operation.size(), operation) == 0 ? 1 : 0;
        }
        return found;
    }
    std::string addVolume(std::string const &containerId, std::string const &directoryName,
                          Orka::VolumeKind kind = Orka::VolumeKind::Config) {
        std::string const uuid = fmt::format("00000000-0000-4000-8000-{:012}", volumes.size() + 1);
        Orka::VirtualVolume volume;
        volume.uuid = uuid;
        volume.containerId = containerId;
        volume.directoryName = directoryName;
        volume.kind = kind;
        volume.sizeMb = 4096;
        volume.blockSize = 512;
        volumes.emplace(uuid, volume);
        return uuid;
    }
};

class FakeProvider : public Orka::Provider {
public:
    explicit FakeProvider(std::shared_ptr<FakeVendor> vendor)
        : vendor_(std::move(vendor)) {}

    Answer<Orka::Listing<Orka::StorageArray>> queryStorageArray(Orka::CallContext context) override {
        return perform<Orka::Listing<Orka::StorageArray>>("queryStorageArray", "", context, [this] {
            return Orka::Listing<Orka::StorageArray>{
                std::make_shared<std::vector<Orka::StorageArray> const>(vendor_->arrays), vendor_->version};
        });
    }
    Answer<Orka::Listing<Orka::StorageContainer>> queryStorageContainer(Orka::CallContext context) override {
        return perform<Orka::Listing<Orka::StorageContainer>>("queryStorageContainer", "", context, [this] {
            return Orka::Listing<Orka::StorageContainer>{
                std::make_shared<std::vector<Orka::StorageContainer> const>(vendor_->containers), vendor_->version};
        });
    }
    Answer<Orka::VirtualVolume> createVirtualVolume(Orka::CallContext context, Orka::VolumeSpec spec) override {
        return perform<Orka::VirtualVolume>("createVirtualVolume", spec.directoryName, context, [this, spec] {
            std::string const uuid = vendor_->addVolume(spec.containerId, spec.directoryName, spec.kind);
            Orka::VirtualVolume &volume = vendor_->volumes.at(uuid);
            volume.profile = spec.profile;
            volume.vmUuid = spec.vmUuid;
            volume.sizeMb = spec.sizeMb == 0 ? volume.sizeMb : spec.sizeMb;
            return volume;
        });
    }
    Answer<Orka::Done> deleteVirtualVolume(Orka::CallContext context, std::string, std::string uuid) override {
        return perform<Orka::Done>("deleteVirtualVolume", uuid, context, [this, uuid] {
            if (known(uuid).boundTo) {
                throw Wire::Failure(Wire::ErrorCode::InUse, "it is bound");
            }
            vendor_->volumes.erase(uuid);
            return Orka::Done{};
        });
    }
    Answer<Orka::Done> bindVirtualVolume(Orka::CallContext context, std::string, std::string uuid,
                                         std::string endpoint) override {
        return perform<Orka::Done>("bindVirtualVolume", uuid + " " + endpoint, context, [this, uuid, endpoint] {
            if (known(uuid).boundTo && known(uuid).boundTo != endpoint) {
                throw Wire::Failure(Wire::ErrorCode::InUse, "it is bound to another endpoint");
            }
            known(uuid).boundTo = endpoint;
            return Orka::Done{};
        });
    }
    Answer<Orka::Done> unbindVirtualVolume(Orka::CallContext context, std::string, std::string uuid) override {
        return perform<Orka::Done>("unbindVirtualVolume", uuid, context, [this, uuid] {
            known(uuid).boundTo.reset();
            return Orka::Done{};
        });
    }
    Answer<Orka::VirtualVolume> queryVirtualVolume(Orka::CallContext context, std::string, std::string uuid) override {
        return perform<Orka::VirtualVolume>("queryVirtualVolume", uuid, context, [this, uuid] { return known(uuid); });
    }
    Answer<std::vector<Orka::ConfigVolume>>
    queryVirtualVolumesOfContainer(Orka::CallContext context, std::string containerId, int64_t max) override {
        return perform<std::vector<Orka::ConfigVolume>>(
            "queryVirtualVolumesOfContainer", fmt::format("{} {}", containerId, max), context,
            [this, containerId, max] {
                std::vector<Orka::ConfigVolume> found;
                for (auto const &[uuid, volume] : vendor_->volumes) {
                    if (volume.containerId == containerId && volume.kind == Orka::VolumeKind::Config &&
                        static_cast<int64_t>(found.size()) < max) {
                        found.push_back({uuid, volume.directoryName, volume.boundTo});
                    }
                }
                return found;
            });
    }
    Answer<std::vector<Orka::VolumePresence>> queryVirtualVolumesById(Orka::CallContext context, std::string,
                                                                      std::vector<std::string> uuids) override {
        return perform<std::vector<Orka::VolumePresence>>(
            "queryVirtualVolumesById", fmt::format("{}", uuids.size()), context, [this, uuids] {
                std::vector<Orka::VolumePresence> found;
                for (std::string const &uuid : uuids) {
                    auto const volume = vendor_->volumes.find(uuid);
                    found.push_back(volume == vendor_->volumes.end()
                                        ? Orka::VolumePresence{}
                                        : Orka::VolumePresence{true, volume->second.boundTo});
                }
                found.resize(found.size() - (vendor_->swallowsAnswers ? 1 : 0));
                return found;
            });
    }
    Answer<std::optional<Orka::VirtualVolume>>
    queryVirtualVolumeByDirectoryName(Orka::CallContext context, std::string containerId, std::string name) override {
        return perform<std::optional<Orka::VirtualVolume>>(
            "queryVirtualVolumeByDirectoryName", name, context, [this, containerId, name] {
                std::optional<Orka::VirtualVolume> found;
                for (auto const &entry : vendor_->volumes) {
                    if (entry.second.containerId == containerId && entry.second.directoryName == name) {
                        found = entry.second;
                    }
                }
                return found;
            });
    }
    Answer<std::vector<Orka::VirtualVolume>> queryVirtualVolumesBound(Orka::CallContext context) override {
        return perform<std::vector<Orka::VirtualVolume>>("queryVirtualVolumesBound", "", context,
                                                         [] { return std::vector<Orka::VirtualVolume>(); });
    }
    Answer<Orka::SpaceStats> spaceStatsForVirtualVolume(Orka::CallContext context, std::string,
                                                        std::string uuid) override {
        return perform<Orka::SpaceStats>("spaceStatsForVirtualVolume", uuid, context, [this, uuid] {
            Orka::VirtualVolume const &volume = known(uuid);
            return Orka::SpaceStats{volume.sizeMb, volume.committedMb, volume.unsharedMb};
        });
    }
    Answer<Orka::UnsharedChunks> unsharedChunksVirtualVolume(Orka::CallContext context, std::string,
                                                             std::string uuid) override {
        return perform<Orka::UnsharedChunks>("unsharedChunksVirtualVolume", uuid, context, [this, uuid] {
            return Orka::UnsharedChunks{known(uuid).blockSize, {0x05}};
        });
    }
    Answer<Orka::Metadata> getMetadata(Orka::CallContext context, std::string, std::string uuid) override {
        return perform<Orka::Metadata>("getMetadata", uuid, context, [this, uuid] {
            return Orka::Metadata{{"directoryName", known(uuid).directoryName}, {"key", "one"}, {"key", "two"}};
        });
    }
    Answer<Orka::Done> setContext(Orka::CallContext context) override {
        return perform<Orka::Done>("setContext", context.orkaContext.value_or("-"), context,
                                   [] { return Orka::Done{}; });
    }

private:
    Orka::VirtualVolume &known(std::string const &uuid) const {
        auto const found = vendor_->volumes.find(uuid);
        if (found == vendor_->volumes.end()) {
            throw Wire::Failure(Wire::ErrorCode::NoSuchVolume, "no such volume " + uuid);
        }
        return found->second;
    }

    template <typename T, typename Function>
    Answer<T> perform(std::string const &operation, std::string const &arguments, Orka::CallContext const &context,
                      Function function) {
        vendor_->calls.push_back(arguments.empty() ? operation : operation + " " + arguments);
        vendor_->contexts.push_back(context);
        auto now = [vendor = vendor_, operation, function]() -> Orka::Outcome<T> {
            if (vendor->breaks) {
                vendor->breaks();
            }
            auto const failure = vendor->failing.find(operation);
            if (failure != vendor->failing.end()) {
                return failure->second;
            }
            return Orka::outcomeOf([&]() -> T { return function(); });
        };
        if (vendor_->hanging.count(operation) == 0) {
            return now();
        }
        auto gate = kj::newPromiseAndFulfiller<void>();
        vendor_->held.push_back(kj::mv(gate.fulfiller));
        return gate.promise.then(std::move(now));
    }

    std::shared_ptr<FakeVendor> vendor_;
};

} // namespace LumodTest
