// SPDX-License-Identifier: Apache-2.0
//
// What a storage array is made from: a description in JSON (docs/topology.md tells its members), checked as a whole
// before a byte of an array file is written. Called by the array simulator and by tests.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "orka/Model.h"

namespace Orka {

struct TopologyVolume {
    VirtualVolume volume;
    Metadata metadata;

    bool operator==(TopologyVolume const &) const = default;
};

struct Topology {
    std::vector<StorageArray> arrays;
    std::vector<StorageContainer> containers;
    std::vector<TopologyVolume> volumes; ///< of all containers, in their order

    bool operator==(Topology const &) const = default;
};

/// @param sourceName what sentences call the description, usually its path.
/// @throws Wire::Failure InvalidArgument with the line and column of a mistake in the JSON itself, or with the path of
/// the member whose content is wrong (containers[2].volumes[0].sizeMb).
Topology parseTopology(std::string_view json, std::string const &sourceName);

enum class Replace {
    Never,     ///< a file that exists is a failure, AlreadyExists
    ArrayFile, ///< an array file gives way, and nothing else does; one that is being written to is FileBusy
};

/// Makes an array file: written under another name beside it, synced, and given its name as the last step, so that the
/// name never leads to half a file.
/// @throws Wire::Failure AlreadyExists, File*, DiskFull, IoError; the file at `path` is then as it was.
void makeArrayFile(Topology const &topology, std::string const &path, Replace replace);

} // namespace Orka
