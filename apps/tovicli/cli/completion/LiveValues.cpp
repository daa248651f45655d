// SPDX-License-Identifier: Apache-2.0
#include "completion/LiveValues.h"

#include <cstdlib>
#include <exception>
#include <memory>
#include <set>
#include <unistd.h>

#include "lumolib/LumoLib.h"
#include "store/HostStore.h"
#include "wire/ContainerId.h"
#include "wire/Paths.h"

namespace Tovicli::Cli {

namespace {

using Candidates = std::vector<Candidate>;
using Containers = std::unique_ptr<StorageContainerResult, decltype(&LumoLib_FreeStorageContainerResult)>;

constexpr int32_t mostVolumes = 1000;

/// A session with the daemon, if there is one. It reads its settings from the environment.
class Session {
public:
    explicit Session(LiveQuery const &query) {
        if (query.offline) {
            return;
        }
        setenv("TOVI_ROOT", query.root.c_str(), 1);
        setenv("TOVI_TIMEOUT_MS", std::to_string(query.patience.count()).c_str(), 1);
        unsetenv("TOVI_OFFLINE"); // the tool's own, for registering plug-ins without a daemon
        open_ = LumoLib_Init(0, 0);
    }
    ~Session() {
        if (open_) {
            LumoLib_Exit();
        }
    }
    Session(Session const &) = delete;
    Session &operator=(Session const &) = delete;

    Containers containers() const {
        StorageContainerResult *result = nullptr;
        if (open_) {
            LumoErrorEx const outcome = LumoLib_GetStorageContainer(0, nullptr, &result);
            if (!LumoLib_ErrorExIsSuccess(&outcome)) {
                result = nullptr;
            }
        }
        return {result, &LumoLib_FreeStorageContainerResult};
    }

    /// Uuids of a container's config volumes.
    Candidates volumeIds(std::string const &containerId) const {
        LumoQueryResult *result = nullptr;
        Candidates ids;
        if (open_ && LumoLib_QueryAllConfigLumos(containerId.c_str(), mostVolumes, 0, &result, 0) == 0 &&
            result != nullptr) {
            for (int32_t i = 0; i < result->count; ++i) {
                ids.push_back({result->entries[i]->id});
            }
            LumoLib_FreeQueryResult(result);
        }
        return ids;
    }

private:
    bool open_ = false;
};

class Values {
public:
    explicit Values(LiveQuery const &query)
        : query_(query)
        , store_(query.root, Store::HostStore::Mode::QueryOnly, query.patience) {}

    Candidates get() {
        switch (query_.live) {
        case Live::Providers:
        case Live::ProviderUrls:
            return providers();
        case Live::Arrays:
            return arrays();
        case Live::ExportedContainers:
        case Live::ExportedContainerNames:
            return exported();
        case Live::MountedContainers:
        case Live::MountedPaths:
            return mounted();
        case Live::Volumes:
        case Live::MountedVolumes:
        case Live::UnmountedVolumes:
            return volumes();
        case Live::VolumeIds:
            return volumeIds();
        case Live::Endpoints:
            return endpoints();
        case Live::Outages:
            return outages();
        }
        return {};
    }

private:
    /// Whoever opens a store that a killed process left in the middle of a transaction undoes that transaction.
    bool mayReadStore() const {
        return access((store_.path() + "-journal").c_str(), F_OK) != 0;
    }

    template <typename Entry>
    std::vector<Entry> stored(std::vector<Entry> (Store::HostStore::*read)()) {
        return mayReadStore() ? (store_.*read)() : std::vector<Entry>();
    }

    /// What providers export, as the daemon tells it.
    template <typename Visit>
    void eachContainer(Visit visit) const {
        Session const session(query_);
        Containers const containers = session.containers();
        for (uint32_t i = 0; containers != nullptr && i < containers->containerCount; ++i) {
            visit(*containers->containers[i]);
        }
    }

    /// The arrays of all containers, one as often as containers lie on it.
    template <typename Visit>
    void eachArray(Visit visit) const {
        eachContainer([&](StorageContainerInfo const &container) {
            for (int32_t i = 0; i < container.arrayCount; ++i) {
                visit(*container.arrays[i]);
            }
        });
    }

    Candidates providers() {
        Candidates found;
        for (Store::Provider const &provider : stored(&Store::HostStore::providers)) {
            bool const byUrl = query_.live == Live::ProviderUrls;
            found.push_back(byUrl ? Candidate{provider.url, provider.name} : Candidate{provider.name, provider.url});
        }
        return found;
    }

    Candidates arrays() {
        Candidates found;
        std::set<std::string> seen;
        eachArray([&](StorageArrayInfo const &array) {
            if (seen.insert(array.arrayId).second) {
                found.push_back({array.arrayId, std::string(array.name) + ", " + array.vendorId});
            }
        });
        for (Store::Provider const &provider : stored(&Store::HostStore::providers)) {
            for (Store::ProviderArray const &array : provider.arrays) {
                if (seen.insert(array.arrayId).second) {
                    found.push_back({array.arrayId, "of provider " + provider.name});
                }
            }
        }
        return found;
    }

    Candidates exported() {
        std::set<std::string> mountedIds;
        for (Store::FileSystem const &each : stored(&Store::HostStore::fileSystems)) {
            mountedIds.insert(each.containerId);
        }
        Candidates found;
        eachContainer([&](StorageContainerInfo const &container) {
            bool const isMounted = mountedIds.contains(container.id);
            if (query_.live == Live::ExportedContainers) {
                found.push_back({container.id, std::string(container.name) + (isMounted ? ", mounted" : "")});
            } else if (!isMounted) {
                found.push_back({container.name, container.id});
            }
        });
        return found;
    }

    Candidates mounted() {
        Candidates found;
        std::string const volumes = Wire::Paths(query_.root).volumes();
        for (Store::FileSystem const &each : stored(&Store::HostStore::fileSystems)) {
            bool const byPath = query_.live == Live::MountedPaths;
            found.push_back(byPath ? Candidate{volumes + "/" + each.name, each.containerId}
                                   : Candidate{each.containerId, each.name});
        }
        return found;
    }

    /// Volumes that this host has a directory of.
    Candidates volumes() {
        Candidates found;
        std::optional<std::string> const container = Wire::normalizeContainerId(query_.containerId);
        for (Store::Volume const &volume : stored(&Store::HostStore::volumes)) {
            bool const isMounted = volume.state == Store::VolumeState::Mounted ||
                                   volume.state == Store::VolumeState::Mounting; // not settled yet
            if (volume.state == Store::VolumeState::Removing) {
                continue;
            }
            bool const wanted = query_.live == Live::Volumes || isMounted == (query_.live == Live::MountedVolumes);
            if (wanted && (!container || volume.containerId == *container)) {
                found.push_back({volume.directoryName, volume.uuid + (isMounted ? ", mounted" : "")});
            }
        }
        return found;
    }

    Candidates volumeIds() {
        if (std::optional<std::string> const container = Wire::normalizeContainerId(query_.containerId)) {
            Candidates const asked = Session(query_).volumeIds(*container);
            if (!asked.empty()) {
                return asked;
            }
        }
        Candidates found;
        for (Store::Volume const &volume : stored(&Store::HostStore::volumes)) {
            found.push_back({volume.uuid, volume.directoryName});
        }
        return found;
    }

    Candidates endpoints() {
        Candidates found;
        std::set<std::string> seen;
        eachArray([&](StorageArrayInfo const &array) {
            for (int32_t i = 0; i < array.endpointCount; ++i) {
                char const *const uid = array.endpoints[i]->localUID;
                if (uid != nullptr && seen.insert(uid).second) {
                    found.push_back({uid, array.arrayId});
                }
            }
        });
        return found;
    }

    Candidates outages() {
        Candidates found;
        for (std::string const &uid : stored(&Store::HostStore::endpointOutages)) {
            found.push_back({uid});
        }
        return found;
    }

    LiveQuery const &query_;
    Store::HostStore store_;
};

} // namespace

std::vector<Candidate> liveValues(LiveQuery const &query) {
    try {
        return Values(query).get();
    } catch (std::exception const &) {
        return {}; // whoever completes a word is not told why there is nothing to complete it with
    }
}

} // namespace Tovicli::Cli
