// SPDX-License-Identifier: Apache-2.0
//
// Bugs in lists: of arrays and containers, of volumes.
#include <algorithm>

#include "conformance/bugs/Forwarding.h"

namespace Orka::Conformance {

namespace {

/// Tells another content under the same version, every second time.
class VersionStandsStill final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Listing<StorageContainer>> queryStorageContainer(CallContext context) override {
        return changed(Forwarding::queryStorageContainer(std::move(context)),
                       [times = ++asked_](Listing<StorageContainer> &listing) {
                           auto items = *listing.items;
                           if (times % 2 == 0 && !items.empty()) {
                               items.back().name += " (renamed)";
                           }
                           listing.items = std::make_shared<std::vector<StorageContainer> const>(std::move(items));
                       });
    }

private:
    int asked_ = 0;
};

class VersionRuns final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Listing<StorageArray>> queryStorageArray(CallContext context) override {
        return changed(Forwarding::queryStorageArray(std::move(context)),
                       [this](Listing<StorageArray> &listing) { listing.version += ++asked_; });
    }

private:
    uint64_t asked_ = 0;
};

class ForgetsArray final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Listing<StorageArray>> queryStorageArray(CallContext context) override {
        return changed(Forwarding::queryStorageArray(std::move(context)), [](Listing<StorageArray> &listing) {
            auto items = *listing.items;
            if (!items.empty()) {
                items.pop_back();
            }
            listing.items = std::make_shared<std::vector<StorageArray> const>(std::move(items));
        });
    }
};

class ShoutsIds final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Listing<StorageContainer>> queryStorageContainer(CallContext context) override {
        return changed(Forwarding::queryStorageContainer(std::move(context)), [](Listing<StorageContainer> &listing) {
            auto items = *listing.items;
            for (auto &item : items) {
                std::transform(item.id.begin(), item.id.end(), item.id.begin(), [](char character) {
                    return character >= 'a' && character <= 'f' ? static_cast<char>(character & ~0x20) : character;
                });
            }
            listing.items = std::make_shared<std::vector<StorageContainer> const>(std::move(items));
        });
    }
};

class IgnoresMax final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override {
        return Forwarding::queryVirtualVolumesOfContainer(std::move(context), std::move(containerId),
                                                          max > 0 ? INT64_MAX : max);
    }
};

class CutsMaxTo32Bits final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override {
        // The largest number stands for all, here too.
        return Forwarding::queryVirtualVolumesOfContainer(
            std::move(context), std::move(containerId),
            max == INT64_MAX ? max : static_cast<int64_t>(static_cast<int32_t>(max)));
    }
};

class SortsByName final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override {
        return changed(Forwarding::queryVirtualVolumesOfContainer(std::move(context), std::move(containerId), max),
                       [](std::vector<ConfigVolume> &volumes) {
                           std::sort(volumes.begin(), volumes.end(),
                                     [](ConfigVolume const &left, ConfigVolume const &right) {
                                         return left.directoryName < right.directoryName;
                                     });
                       });
    }
};

class EmptyForUnknown final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context, std::string containerId,
                                                                     int64_t max) override {
        return otherwise(Forwarding::queryVirtualVolumesOfContainer(std::move(context), std::move(containerId), max),
                         Wire::ErrorCode::NoSuchContainer,
                         [](Wire::Failure const &) -> kj::Promise<Outcome<std::vector<ConfigVolume>>> {
                             return Outcome<std::vector<ConfigVolume>>(std::vector<ConfigVolume>{});
                         });
    }
};

/// Asks for each id once and answers in that order.
class SortsIds final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<VolumePresence>> queryVirtualVolumesById(CallContext context, std::string containerId,
                                                                std::vector<std::string> uuids) override {
        std::sort(uuids.begin(), uuids.end());
        return Forwarding::queryVirtualVolumesById(std::move(context), std::move(containerId), std::move(uuids));
    }
};

class DropsRepeatedIds final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<VolumePresence>> queryVirtualVolumesById(CallContext context, std::string containerId,
                                                                std::vector<std::string> uuids) override {
        std::vector<std::string> once;
        for (auto &uuid : uuids) {
            if (std::find(once.begin(), once.end(), uuid) == once.end()) {
                once.push_back(std::move(uuid));
            }
        }
        return Forwarding::queryVirtualVolumesById(std::move(context), std::move(containerId), std::move(once));
    }
};

class ForgetsNewestBound final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::vector<VirtualVolume>> queryVirtualVolumesBound(CallContext context) override {
        return changed(Forwarding::queryVirtualVolumesBound(std::move(context)),
                       [](std::vector<VirtualVolume> &volumes) {
                           if (!volumes.empty()) {
                               volumes.pop_back();
                           }
                       });
    }
};

} // namespace

std::vector<Bug> listBugs() {
    return {
        {"version-stands-still", "Containers change while the list's version stays.",
         "container/list/same-version-same-content", put<VersionStandsStill>,
         "the client asks for a list again only when its version is another"},
        {"version-runs", "The version of the list of arrays grows although nothing changes.",
         "array/list/version-stable", put<VersionRuns>},
        {"forgets-array", "The last storage array is not told, though containers name it.",
         "container/list/arrays-known", put<ForgetsArray>},
        {"shouts-ids", "Containers' ids come in upper case.", "container/list/ids-canonical", put<ShoutsIds>,
         "the client spells ids its own way"},
        {"ignores-max", "A list of volumes is told whole, whatever the bound.", "volume/list/max-one", put<IgnoresMax>,
         "the client takes no more than it asked for"},
        {"cuts-max-to-32-bits", "The bound of a list is cut to 32 bits.", "volume/list/max-beyond-32-bits",
         put<CutsMaxTo32Bits>},
        {"sorts-by-name", "Volumes are listed by name.", "volume/list/order", put<SortsByName>},
        {"empty-for-unknown", "A container that there is not has an empty list of volumes.", "unknown-container/list",
         put<EmptyForUnknown>},
        {"sorts-ids", "Ids are answered in their own order.", "volume/query-by-id/order", put<SortsIds>},
        {"drops-repeated-ids", "An id that occurs again is not answered again.", "volume/query-by-id/repeated",
         put<DropsRepeatedIds>},
        {"forgets-newest-bound", "The newest bound volume is not among the bound ones.", "volume/query-bound/listed",
         put<ForgetsNewestBound>},
    };
}

} // namespace Orka::Conformance
