// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <utility>

#include "Edge.h"
#include "Host.h"
#include "LumoFileSystem.h"
#include "Names.h"
#include "VolumeDirectories.h"
#include "kestrel/Storage.h"
#include "lumolib/Progress.h"

namespace Kestrel::Storage {
namespace {

using HostPointer = std::shared_ptr<Host>;

HostPointer &hostOf(void *impl) {
    return *static_cast<HostPointer *>(impl);
}

Store::Provider toStore(Gantry::Storage::VendorProviderInfo const &record) {
    Store::Provider provider{record.name, record.url, record.auxText, {}};
    for (Gantry::Storage::RelatedStorageArrayInfo const &array : record.arrays) {
        provider.arrays.push_back({array.arrayId, array.isActive, array.priority});
    }
    return provider;
}

Gantry::Storage::VendorProviderInfo fromStore(Store::Provider const &provider) {
    Gantry::Storage::VendorProviderInfo record{provider.name, provider.url, provider.auxText, {}};
    for (Store::ProviderArray const &array : provider.arrays) {
        record.arrays.push_back({array.arrayId, array.isActive, array.priority});
    }
    return record;
}

/// Asked after a failure, because a commit that failed may have taken effect.
bool isRecorded(Host &host, Store::FileSystem const &fileSystem, bool whenUnreadable) {
    try {
        auto const record = host.store.fileSystem(fileSystem.containerId);
        return record && record->name == fileSystem.name;
    } catch (Wire::Failure const &) {
        return whenUnreadable;
    }
}

/// The directory first: a killed process leaves at worst an empty directory, which the next add takes over.
void addToHost(Host &host, Store::FileSystem const &fileSystem, bool mount) {
    bool const made = mount && makeIn(host.places.volumes(), fileSystem.name, 0755);
    try {
        if (mount && !made && kindOf(host.places.volumes(), fileSystem.name) != EntryKind::Directory) {
            throw Wire::Failure(Wire::ErrorCode::AlreadyExists,
                                "'" + host.places.volumes().pathOf(fileSystem.name) +
                                    "' is in the way: it is no directory; move it elsewhere");
        }
        host.store.addFileSystem(fileSystem);
    } catch (Wire::Failure const &) {
        if (made && !isRecorded(host, fileSystem, false)) {
            removeEmptyIn(host.places.volumes(), fileSystem.name);
        }
        throw;
    }
}

void removeFromHost(Host &host, std::string const &containerId) {
    auto const requireRecord = [&] {
        auto record = host.store.fileSystem(containerId);
        if (!record) {
            throw Wire::Failure(Wire::ErrorCode::NoSuchContainer,
                                "the storage container " + containerId + " is not mounted on this host");
        }
        return *record;
    };
    requireRecord(); // before the directories' lock, which would make a host of what is none
    VolumeDirectories directories(host);
    Store::FileSystem const fileSystem = requireRecord(); // another process may have removed it meanwhile
    directories.finishUnsettled();
    host.store.requireNoMounts(containerId);
    Directory const &volumes = host.places.volumes();
    if (removeEmptyIn(volumes, fileSystem.name) == Outcome::InTheWay) {
        bool const isDirectory = kindOf(volumes, fileSystem.name) == EntryKind::Directory;
        throw Wire::Failure(
            Wire::ErrorCode::InUse,
            "the storage container '" + fileSystem.name + "' is in use: its directory '" +
                volumes.pathOf(fileSystem.name) +
                (isDirectory ? "' is not empty, there is '" + anyEntryIn(openIn(volumes, fileSystem.name)) + "' in it"
                             : "' is no directory any more"));
    }
    try {
        host.store.removeFileSystem(containerId);
    } catch (Wire::Failure const &) {
        if (isRecorded(host, fileSystem, true)) {
            makeIn(volumes, fileSystem.name, 0755);
        }
        throw;
    }
}

std::vector<std::string> notifyHost(Host &host, std::string const &endpoint, bool apd) {
    std::vector<std::string> containers;
    try {
        containers = host.client.protocolEndpointEvent(endpoint, apd);
    } catch (Wire::Failure const &failure) {
        // The outage of an endpoint that its array no longer has must come to an end all the same.
        auto const outages = host.store.endpointOutages();
        bool const known = std::find(outages.begin(), outages.end(), endpoint) != outages.end();
        if (failure.code() != Wire::ErrorCode::NoSuchEndpoint || apd || !known) {
            throw;
        }
    }
    host.store.setEndpointOutage(endpoint, apd);
    return containers;
}

} // namespace

StorageInfoImpl::StorageInfoImpl()
    : impl_(new HostPointer(Host::ofEnvironment())) {}

StorageInfoImpl::~StorageInfoImpl() {
    delete static_cast<HostPointer *>(impl_);
}

std::vector<Gantry::Storage::LumoFileSystem *> StorageInfoImpl::GetLumoFileSystems() {
    return atEdge([this] {
        HostPointer const &host = hostOf(impl_);
        FileSystemMaker maker(host);
        std::vector<std::unique_ptr<LumoFileSystem>> owned;
        host->store.visitFileSystems([&](std::string_view name, std::string_view containerId) {
            owned.push_back(maker.make(name, containerId));
        });
        std::vector<Gantry::Storage::LumoFileSystem *> fileSystems;
        fileSystems.reserve(owned.size());
        for (auto &fileSystem : owned) {
            fileSystems.push_back(fileSystem.release());
        }
        // Whoever mounts what a list of containers names asks this first, and leaves these out.
        LumoPlatform_NoteNotNeeded(fileSystems.size());
        return fileSystems;
    });
}

Gantry::Storage::LumoFileSystem *StorageInfoImpl::AddLumoFileSystem(std::string const &name, std::string &id,
                                                                    std::vector<std::string> const &arrayIds,
                                                                    bool mount) {
    return atEdge([&]() -> LumoFileSystem * {
        HostPointer const &host = hostOf(impl_);
        requireContainerName(name);
        std::string const containerId = requireContainerId(id);
        host->containerCheck.require(containerId, arrayIds);
        addToHost(*host, {name, containerId, arrayIds}, mount);
        LumoPlatform_NoteOneDone();
        id = containerId;
        return FileSystemMaker::makeOne(host, name, containerId).release();
    });
}

Gantry::Storage::LumoFileSystem *StorageInfoImpl::GetLumoFileSystemByPath(std::string const &path) {
    return atEdge([&]() -> LumoFileSystem * {
        HostPointer const &host = hostOf(impl_);
        auto const name = host->places.containerOf(path);
        auto const fileSystem = name ? host->store.fileSystemNamed(*name) : std::nullopt;
        return fileSystem ? FileSystemMaker::makeOne(host, fileSystem->name, fileSystem->containerId).release()
                          : nullptr;
    });
}

void StorageInfoImpl::RemoveLumoFileSystem(std::string containerId) {
    atEdge([&] { removeFromHost(*hostOf(impl_), requireContainerId(containerId)); });
}

bool StorageInfoImpl::LumoVpExists(std::string const &name) {
    return atEdge([&] { return hostOf(impl_)->store.hasProvider(name); });
}

void StorageInfoImpl::GetLumoVendorProviders(std::string const &name,
                                             std::vector<Gantry::Storage::VendorProviderInfo> &records) {
    atEdge([&] {
        if (auto const provider = hostOf(impl_)->store.provider(name)) {
            records.push_back(fromStore(*provider));
        }
    });
}

void StorageInfoImpl::UpdateLumoVendorProvider(std::vector<Gantry::Storage::VendorProviderInfo> const &records) {
    atEdge([&] {
        std::vector<Store::Provider> providers;
        for (Gantry::Storage::VendorProviderInfo const &record : records) {
            providers.push_back(toStore(record));
        }
        hostOf(impl_)->store.putProviders(providers);
    });
}

void StorageInfoImpl::NotifyLumoProtocolEndpointEvent(std::string const &pe,
                                                      Gantry::Storage::ProtocolEndPointEvent event,
                                                      std::vector<std::string> &containers) {
    atEdge([&] {
        if (event != Gantry::Storage::ApdStart && event != Gantry::Storage::ApdEnd) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                                "Protocol endpoint event " + std::to_string(event) +
                                    " is unknown: 0 (APD start) or 1 (APD end) is expected");
        }
        containers = notifyHost(*hostOf(impl_), pe, event == Gantry::Storage::ApdStart);
    });
}

} // namespace Kestrel::Storage
