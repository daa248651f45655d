// SPDX-License-Identifier: Apache-2.0
#include "ConfigVolumes.h"

#include <algorithm>
#include <utility>

#include "Names.h"
#include "VolumeDirectories.h"

namespace Kestrel {
namespace {

bool isMounted(Store::Volume const &volume) {
    return volume.state == Store::VolumeState::Mounted || volume.state == Store::VolumeState::Mounting;
}

bool isGone(Wire::Failure const &failure) {
    return failure.code() == Wire::ErrorCode::NoSuchVolume || failure.code() == Wire::ErrorCode::NoSuchContainer;
}

bool hasNamed(std::vector<Store::Volume> const &volumes, LumoClient::VolumeKey const &key) {
    return std::any_of(volumes.begin(), volumes.end(), [&](Store::Volume const &volume) {
        return volume.containerId == key.containerId &&
               (key.uuid.empty() ? volume.directoryName == key.directoryName : volume.uuid == key.uuid);
    });
}

Store::Volume inState(Store::Volume volume, Store::VolumeState state) {
    volume.state = state;
    return volume;
}

} // namespace

ConfigVolumes::ConfigVolumes(Host &host, std::string containerName, std::string containerId,
                             LumoClient::Channel channel)
    : host_(host)
    , containerName_(std::move(containerName))
    , containerId_(std::move(containerId))
    , channel_(channel) {}

LumoClient::VolumeKey ConfigVolumes::keyOf(std::string const &name, std::string const &uuid) const {
    if (!uuid.empty()) {
        return {containerId_, requireVolumeUuid(uuid), {}};
    }
    requireDirectoryName(name, "directory name");
    return {containerId_, {}, name};
}

std::optional<Store::Volume> ConfigVolumes::recordOf(LumoClient::VolumeKey const &key) {
    if (key.uuid.empty()) {
        return host_.store.mountedVolume(containerId_, key.directoryName);
    }
    auto record = host_.store.volume(key.uuid);
    return record && record->containerId == containerId_ ? record : std::nullopt;
}

Store::Volume ConfigVolumes::requireMounted(LumoClient::VolumeKey const &key) {
    auto record = recordOf(key);
    if (!record || !isMounted(*record)) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchVolume,
                            key.uuid.empty()
                                ? "no config volume named '" + key.directoryName +
                                      "' is mounted in the storage container '" + containerName_ + '\''
                                : "the config volume " + key.uuid + " is not mounted in the storage container '" +
                                      containerName_ + '\'');
    }
    return *record;
}

std::optional<Store::Volume> ConfigVolumes::recordAfter(std::vector<Store::Volume> const &settled,
                                                        std::string const &uuid) {
    auto const seen =
        std::find_if(settled.begin(), settled.end(), [&](Store::Volume const &volume) { return volume.uuid == uuid; });
    return seen != settled.end() ? *seen : host_.store.volume(uuid);
}

void ConfigVolumes::mount(std::string const &name, std::string const &uuid) {
    LumoClient::Volume const bound = host_.client.bindVirtualVolume(keyOf(name, uuid), channel_);
    try {
        place(bound);
    } catch (Wire::Failure const &) {
        if (!mayBeMounted(bound.uuid)) {
            unbindQuietly(bound.uuid);
        }
        throw;
    }
}

void ConfigVolumes::place(LumoClient::Volume const &bound) {
    // What a provider calls its volumes becomes part of a path here.
    requireDirectoryName(bound.uuid, "volume uuid");
    if (bound.directoryName.empty()) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            "the virtual volume " + bound.uuid + " is no config volume: it has no directory name");
    }
    requireDirectoryName(bound.directoryName, "directory name");
    VolumeDirectories directories(host_);
    Store::HostStore::Change change(host_.store);
    auto const &settled = directories.finishUnsettled();
    if (auto const record = recordAfter(settled, bound.uuid); record && isMounted(*record)) {
        throw Wire::Failure(Wire::ErrorCode::AlreadyExists,
                            "the config volume '" + record->directoryName + "' (" + record->uuid +
                                ") is mounted already in the storage container '" + containerName_ + '\'');
    }
    Store::Volume const volume{bound.uuid, containerId_, bound.directoryName, Store::VolumeState::Mounting};
    directories.prepareMount(volume, containerName_);
    host_.store.putVolumes({volume}, settled);
    change.commit();
    try {
        directories.bringOut(volume, containerName_);
    } catch (Wire::Failure const &) {
        host_.store.putVolumes({inState(volume, Store::VolumeState::Unmounted)}, {});
        throw;
    }
}

void ConfigVolumes::unmount(std::string const &name, std::string const &uuid) {
    LumoClient::VolumeKey const key = keyOf(name, uuid);
    auto record = recordOf(key);
    if (!record || !isMounted(*record)) {
        VolumeDirectories(host_).finishUnsettled(); // an unmount that was killed still has its directory to put away
        record = requireMounted(key);
    }
    Store::Volume const volume = *record;
    try {
        // Not under the lock: an answer may take as long as the timeout.
        host_.client.unbindVirtualVolume({containerId_, volume.uuid, {}}, channel_);
    } catch (Wire::Failure const &failure) {
        if (!isGone(failure)) {
            throw;
        }
        // Deleted behind this host's back: there is nothing to unbind, and no reason to keep the mount.
    }
    try {
        VolumeDirectories directories(host_);
        {
            Store::HostStore::Change change(host_.store);
            auto const &settled = directories.finishUnsettled();
            // Still: asked as before, since a question of another form costs more than its answer.
            if (auto const again = recordOf(key); !again || again->uuid != volume.uuid || !isMounted(*again)) {
                requireMounted({containerId_, volume.uuid, {}});
            }
            host_.store.putVolumes({inState(volume, Store::VolumeState::Unmounting)}, settled);
            change.commit();
        }
        try {
            directories.putAway(volume, containerName_);
        } catch (Wire::Failure const &) {
            host_.store.putVolumes({inState(volume, Store::VolumeState::Mounted)}, {});
            throw;
        }
    } catch (Wire::Failure const &) {
        if (mayBeMounted(volume.uuid)) {
            bindQuietly(volume.uuid); // it stays mounted
        }
        throw;
    }
}

void ConfigVolumes::remove(std::string const &name, std::string const &uuid) {
    LumoClient::VolumeKey key = keyOf(name, uuid);
    std::vector<Store::Volume> here;
    bool finishedNow = false;
    {
        VolumeDirectories directories(host_);
        auto const &settled = directories.finishUnsettled();
        finishedNow = hasNamed(directories.removedNow(), key);
        here = recordsOf(key, settled);
    }
    if (here.size() == 1 && isMounted(here.front())) {
        // What is mounted here under the name is what its user means.
        key = {containerId_, here.front().uuid, {}};
    }
    try {
        here = {{host_.client.deleteVirtualVolume(key, channel_).uuid, containerId_, {}, {}}};
    } catch (Wire::Failure const &failure) {
        // A removal that was cut off, or a volume deleted elsewhere: what is left of it here is all there is to remove.
        if (failure.code() != Wire::ErrorCode::NoSuchVolume || (here.empty() && !finishedNow)) {
            throw;
        }
    }
    for (Store::Volume const &volume : here) {
        forget(volume);
    }
}

std::vector<Store::Volume> ConfigVolumes::recordsOf(LumoClient::VolumeKey const &key,
                                                    std::vector<Store::Volume> const &settled) {
    if (auto const record = recordOf(key)) {
        // A removal that is done leaves its record to the next write.
        bool const isGone = record->state == Store::VolumeState::Removing && hasNamed(settled, key);
        return isGone ? std::vector<Store::Volume>() : std::vector<Store::Volume>{*record};
    }
    std::vector<Store::Volume> records;
    if (key.uuid.empty()) {
        for (Store::Volume const &record : host_.store.unmountedVolumes(containerId_, key.directoryName)) {
            if (record.state != Store::VolumeState::Removing) {
                records.push_back(record);
            }
        }
    }
    return records;
}

void ConfigVolumes::forget(Store::Volume const &volume) {
    try {
        requireDirectoryName(volume.uuid, "volume uuid");
        VolumeDirectories directories(host_);
        auto const &settled = directories.finishUnsettled();
        if (auto const record = host_.store.volume(volume.uuid); record) {
            host_.store.putVolumes({inState(*record, Store::VolumeState::Removing)}, settled);
            directories.putAway(*record, containerName_);
        }
        directories.discard(volume.uuid);
    } catch (Wire::Failure const &failure) {
        throw Wire::Failure(failure.code(),
                            "the config volume is deleted on its array, but what it held on this host is "
                            "not: " +
                                failure.sentence());
    }
}

bool ConfigVolumes::mayBeMounted(std::string const &uuid) {
    try {
        auto const record = host_.store.volume(uuid);
        return record && isMounted(*record);
    } catch (Wire::Failure const &) {
        return true;
    }
}

void ConfigVolumes::bindQuietly(std::string const &uuid) {
    try {
        host_.client.bindVirtualVolume({containerId_, uuid, {}}, channel_);
    } catch (Wire::Failure const &) {
        // The failure that led here is the one to report.
    }
}

void ConfigVolumes::unbindQuietly(std::string const &uuid) {
    try {
        host_.client.unbindVirtualVolume({containerId_, uuid, {}}, channel_);
    } catch (Wire::Failure const &) {
        // The failure that led here is the one to report.
    }
}

} // namespace Kestrel
