// SPDX-License-Identifier: Apache-2.0
//
// The host's storage configuration: registered providers, mounted storage containers, protocol-endpoint events and the
// Orka context.
//
// A command makes a StorageInfoImpl for the length of one call. Every operation reports failure by throwing
// Gantry::Lib::GantryException, whose message is a finished text for the user. What is written is durable when the
// operation returns. Lumo file systems that are handed out belong to the caller, who deletes each one.
#pragma once

#include <string>
#include <vector>

#include "gantry/Storage.h"
#include "kestrel/Lib.h"

namespace Kestrel::Storage {

class KESTREL_EXPORT StorageInfoImpl {
public:
    StorageInfoImpl();
    ~StorageInfoImpl();
    StorageInfoImpl(StorageInfoImpl const &) = delete;
    StorageInfoImpl &operator=(StorageInfoImpl const &) = delete;

    /// Every mounted container, in the order in which they were added. The caller deletes each.
    std::vector<Gantry::Storage::LumoFileSystem *> GetLumoFileSystems();
    /// Mounts a container as a Lumo file system.
    /// @param id       any accepted spelling of the container id; becomes the canonical one
    /// @param arrayIds the arrays that must hold the container; empty asks for no particular one
    /// @param mount    whether the container's directory is to appear; every caller passes true
    /// @return the caller deletes it; may be null when a host declines without a reason
    Gantry::Storage::LumoFileSystem *AddLumoFileSystem(std::string const &name, std::string &id,
                                                       std::vector<std::string> const &arrayIds, bool mount);
    /// The file system whose directory (or a path inside it) is given; null when there is none. The caller deletes it.
    Gantry::Storage::LumoFileSystem *GetLumoFileSystemByPath(std::string const &path);
    void RemoveLumoFileSystem(std::string containerId);

    bool LumoVpExists(std::string const &name);
    /// Appends the record of that name, if there is one.
    void GetLumoVendorProviders(std::string const &name, std::vector<Gantry::Storage::VendorProviderInfo> &records);
    /// Creates or replaces the record of each name, all or none.
    void UpdateLumoVendorProvider(std::vector<Gantry::Storage::VendorProviderInfo> const &records);

    /// Keeps the event and tells the daemon.
    /// @param containers set to the names of the containers that the endpoint serves
    void NotifyLumoProtocolEndpointEvent(std::string const &pe, Gantry::Storage::ProtocolEndPointEvent event,
                                         std::vector<std::string> &containers);

private:
    void *impl_;
};

/// Operations that need no object.
class KESTREL_EXPORT LumoFileSystemImpl {
public:
    static void UnRegisterVendorProvider(std::string const &name);
    static void SetOrkaContext(std::string const &uuid);
    static void ClearOrkaContext();
};

} // namespace Kestrel::Storage
