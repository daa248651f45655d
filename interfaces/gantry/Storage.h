// SPDX-License-Identifier: Apache-2.0
//
// What the host's storage configuration hands out: provider records and mounted storage containers.
//
// The records are plain values. FileSystem and LumoFileSystem are stateless interfaces; a Lumo file system that an
// operation returns belongs to the caller, who deletes it through the virtual destructor. Every operation reports
// failure by throwing Gantry::Lib::GantryException. Slot order is part of the binary interface.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "gantry/Lib.h"

namespace Gantry::Storage {

/// One storage array that a provider serves.
struct RelatedStorageArrayInfo {
    std::string arrayId;
    /// Whether this provider is the active one for the array.
    bool isActive = true;
    /// Among a provider's rivals for an array, the highest number serves it.
    int32_t priority = 0;
};

/// One registered Orka provider. The name is the key under which the host keeps the record.
struct VendorProviderInfo {
    std::string name;
    std::string url;
    /// Kept and handed back as it came; nothing on this host sets it.
    std::string auxText;
    /// In the order given at registration.
    std::vector<RelatedStorageArrayInfo> arrays;
};

/// Whether the host can use a virtual volume.
enum LumoAccessibilityType : int32_t { NonExistent = 0, Unconfirmed = 1, Inaccessible = 2, Accessible = 3 };

/// All paths down (APD) on a protocol endpoint: its begin and its end.
enum ProtocolEndPointEvent : int32_t { ApdStart = 0, ApdEnd = 1 };

/// A file system of the host, with the operations on the config volumes in it.
///
/// A config volume is named by its directory name or by its uuid: an empty uuid means that the name counts. `extra` is
/// reserved and empty. `priority` sends the request past the daemon's ordered queue.
class GANTRY_EXPORT FileSystem {
public:
    virtual ~FileSystem() = default;
    virtual std::string GetName() = 0;
    virtual std::string GetId() = 0;
    /// Creates a config volume.
    /// @param sizeMb size in MB; 0 asks for the host's default
    /// @param out    receives the new volume's uuid
    virtual void CreateConfigLumo(std::string const &name, std::string const &policy, int64_t sizeMb,
                                  std::string const &vmUuid, std::string &out, std::string const &extra,
                                  bool priority) = 0;
    /// Unmounts and deletes a config volume, with what its directory holds.
    virtual void RemoveConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                  bool priority) = 0;
    /// Keeps its slot; no command calls it.
    virtual void ReservedConfigLumo(std::string const &first, std::string const &second, std::string const &extra,
                                    bool priority) = 0;
    /// Binds a config volume and makes its directory appear.
    virtual void MountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                 bool priority) = 0;
    /// Makes a config volume's directory disappear; its content is kept.
    virtual void UnmountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                   bool priority) = 0;
};

/// A storage container that is mounted on the host. Declares no destructor: its operations follow FileSystem's slots.
class GANTRY_EXPORT LumoFileSystem : public virtual FileSystem {
public:
    /// Whether this is the file system of that container, in any accepted spelling of the id.
    virtual bool HasContainerId(std::string const &containerId) = 0;
    virtual std::string GetContainerId() = 0;
    /// One element for each volume id, in the order of the ids.
    virtual std::vector<LumoAccessibilityType> CheckLumoAccessibility(std::vector<std::string> const &lumoIds) = 0;
};

} // namespace Gantry::Storage
