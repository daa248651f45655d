// SPDX-License-Identifier: Apache-2.0
#include "VolumeDirectories.h"

#include "RemoveTree.h"
#include "wire/Failure.h"

namespace Kestrel {
namespace {

constexpr mode_t contentMode = 0755;

[[noreturn]] void refuseInTheWay(std::string const &path) {
    throw Wire::Failure(Wire::ErrorCode::AlreadyExists,
                        "'" + path + "' is in the way: it is no config volume's directory; move it elsewhere");
}

[[noreturn]] void refuseReplaced(std::string const &path) {
    throw Wire::Failure(Wire::ErrorCode::InUse,
                        "'" + path + "' is no longer the directory that was mounted there; move it elsewhere");
}

} // namespace

VolumeDirectories::VolumeDirectories(Host &host)
    : host_(host)
    , lock_(host.places.lumos(), host.lockTimeout) {}

std::vector<Store::Volume> const &VolumeDirectories::finishUnsettled() {
    settled_.clear();
    removedNow_.clear();
    for (Store::UnsettledVolume const &unsettled : host_.store.unsettledVolumes()) {
        try {
            finish(unsettled.volume, unsettled.containerName);
            settled_.push_back(unsettled.volume);
        } catch (Wire::Failure const &) {
            // Something stands in its way. It stays unsettled, and an operation on that volume says why; others go on.
        }
    }
    return settled_;
}

void VolumeDirectories::finish(Store::Volume const &volume, std::string const &containerName) {
    switch (volume.state) {
    case Store::VolumeState::Mounting:
        bringOut(volume, containerName);
        break;
    case Store::VolumeState::Unmounting:
        putAway(volume, containerName);
        break;
    case Store::VolumeState::Removing:
        putAway(volume, containerName);
        if (kindOf(host_.places.lumos(), volume.uuid) != EntryKind::Nothing) {
            discard(volume.uuid);
            removedNow_.push_back(volume);
        }
        break;
    case Store::VolumeState::Mounted:
    case Store::VolumeState::Unmounted:
        break;
    }
}

Directory const &VolumeDirectories::container(std::string const &name) {
    if (!container_.descriptor || containerName_ != name) {
        container_ = host_.places.container(name);
        containerName_ = name;
    }
    return container_;
}

void VolumeDirectories::prepareMount(Store::Volume const &volume, std::string const &containerName) {
    Directory const &container = this->container(containerName);
    if (kindOf(container, volume.directoryName) != EntryKind::Nothing) {
        refuseInTheWay(container.pathOf(volume.directoryName));
    }
    Directory const &lumos = host_.places.lumos();
    if (!makeIn(lumos, volume.uuid, contentMode) && kindOf(lumos, volume.uuid) != EntryKind::Directory) {
        refuseReplaced(lumos.pathOf(volume.uuid));
    }
}

void VolumeDirectories::bringOut(Store::Volume const &volume, std::string const &containerName) {
    Directory const &lumos = host_.places.lumos();
    Directory const &container = this->container(containerName);
    switch (moveTo(lumos, volume.uuid, container, volume.directoryName)) {
    case Outcome::Done:
        return;
    case Outcome::InTheWay:
        refuseInTheWay(container.pathOf(volume.directoryName));
    case Outcome::NothingThere:
        // Brought out already, or lost by somebody's hand: mounted it is, so there is a directory.
        if (!makeIn(container, volume.directoryName, contentMode) &&
            kindOf(container, volume.directoryName) != EntryKind::Directory) {
            refuseReplaced(container.pathOf(volume.directoryName));
        }
    }
}

void VolumeDirectories::putAway(Store::Volume const &volume, std::string const &containerName) {
    Directory const &lumos = host_.places.lumos();
    Directory const &container = this->container(containerName);
    switch (kindOf(container, volume.directoryName)) {
    case EntryKind::Nothing:
        return;
    case EntryKind::Other:
        refuseReplaced(container.pathOf(volume.directoryName));
    case EntryKind::Directory:
        break;
    }
    // A put-away directory that holds nothing may go; one that holds something is never mixed with another.
    if (moveTo(container, volume.directoryName, lumos, volume.uuid) == Outcome::InTheWay &&
        (removeEmptyIn(lumos, volume.uuid) == Outcome::InTheWay ||
         moveTo(container, volume.directoryName, lumos, volume.uuid) == Outcome::InTheWay)) {
        refuseInTheWay(lumos.pathOf(volume.uuid));
    }
}

void VolumeDirectories::discard(std::string const &uuid) {
    removeTree(host_.places.lumos(), uuid);
}

} // namespace Kestrel
