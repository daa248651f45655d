// SPDX-License-Identifier: Apache-2.0
//
// Stands in for libkestrel: linked in its place, it defines the members of StorageInfoImpl, the statics of
// LumoFileSystemImpl and VectorToString. A test makes one KestrelDouble, says what the host answers, runs a command and
// reads the log. While a KestrelDouble lives it serves every host call of the process.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "doubles/Answers.h"
#include "doubles/CallLog.h"
#include "doubles/RecordingFileSystem.h"
#include "gantry/Storage.h"

namespace Doubles {

class KestrelDouble {
public:
    explicit KestrelDouble(CallLog &callLog);
    ~KestrelDouble();
    KestrelDouble(KestrelDouble const &) = delete;
    KestrelDouble &operator=(KestrelDouble const &) = delete;

    /// The one that serves the process's calls.
    static KestrelDouble &current();

    CallLog &log;

    Answers<std::vector<FileSystemScript>> getLumoFileSystems;
    /// Not set: a null pointer.
    Answers<std::optional<FileSystemScript>> addLumoFileSystem;
    Answers<std::optional<FileSystemScript>> getLumoFileSystemByPath;
    Answers<Done> removeLumoFileSystem;
    Answers<bool> lumoVpExists{false};
    /// Appended to the caller's list.
    Answers<std::vector<Gantry::Storage::VendorProviderInfo>> getLumoVendorProviders;
    Answers<Done> updateLumoVendorProvider;
    /// The containers that the endpoint serves.
    Answers<std::vector<std::string>> notifyEndpointEvent;
    Answers<Done> unRegisterVendorProvider;
    Answers<Done> setOrkaContext;
    Answers<Done> clearOrkaContext;

    /// Objects made and not destroyed yet.
    int liveHosts = 0;
    int liveFileSystems = 0;
};

} // namespace Doubles
