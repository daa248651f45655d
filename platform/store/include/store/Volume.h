// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Store {

/// A config volume's directory is either mounted (volumes/<container>/<directory name>) or put away (lumos/<uuid>). The
/// record goes first, the directory follows by a rename. So a record that was written by an operation says that the
/// directory is on its way (Mounting, Unmounting, Removing) until a later transaction settles it. A process that was
/// killed in between leaves an unsettled record, and the next one that mounts, unmounts or removes finishes the rename.
enum class VolumeState : int32_t {
    Mounted = 0,
    Unmounted = 1,
    Mounting = 2,   ///< settles to Mounted
    Unmounting = 3, ///< settles to Unmounted
    Removing = 4,   ///< is being deleted on the array; put away until it is; settles to no record
};

/// A config volume that has, or had, a directory on this host.
struct Volume {
    std::string uuid;
    /// Canonical; one of the file systems.
    std::string containerId;
    std::string directoryName;
    VolumeState state = VolumeState::Mounted;
    bool operator==(Volume const &) const = default;
};

/// A config volume whose directory may be on its way, and the name under which its container is mounted.
struct UnsettledVolume {
    Volume volume;
    std::string containerName;
    bool operator==(UnsettledVolume const &) const = default;
};

/// A config volume that is mounted or about to be.
struct Mount {
    std::string volumeUuid;
    std::string containerId;
    std::string directoryName;
    bool operator==(Mount const &) const = default;
};

} // namespace Store
