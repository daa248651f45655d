// SPDX-License-Identifier: Apache-2.0
//
// What the config-volume commands share: the mounted containers and the one that is meant, and the whole of mount,
// unmount and remove, which differ in one operation and two texts.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "CommandFrame.h"
#include "gantry/Storage.h"
#include "kestrel/Storage.h"

namespace TarselCli::LumoNamespace {

/// Owned here: each is deleted when the call ends, however it ends.
using FileSystems = std::vector<std::unique_ptr<Gantry::Storage::LumoFileSystem>>;

/// Every mounted container, in the host's order.
FileSystems mountedFileSystems(Kestrel::Storage::StorageInfoImpl &host);

/// @return the first file system that says it is the container's; null when none does.
Gantry::Storage::LumoFileSystem *findContainer(FileSystems const &fileSystems, std::string const &containerId);

/// Leaves the message for a container that is not mounted, and false as the result.
void reportUnknownContainer(OutputPtr const &output, std::string const &containerId);

/// An operation on a config volume: directory name, uuid, an extra text that is always empty, priority.
using VolumeOperation = void (Gantry::Storage::FileSystem::*)(std::string const &name, std::string const &uuid,
                                                              std::string const &extra, bool priority);

/// @param nameDescription the description of the parameter "name"
InputSpecPtr declareVolumeParameters(char const *nameDescription);

/// Finds the volume's container and runs the operation on it.
/// @param missingText the message when neither name nor uuid was given
void runOnVolume(InputPtr const &input, OutputPtr const &output, char const *missingText, VolumeOperation operation);

} // namespace TarselCli::LumoNamespace
