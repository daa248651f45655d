// SPDX-License-Identifier: Apache-2.0
//
// Descriptions of storage arrays, as `orkasim make` reads them, and the array files that it makes of them.
#include <algorithm>
#include <string>

#include "Property.h"
#include "Scratch.h"
#include "orka/ArrayFile.h"
#include "orka/Topology.h"

namespace {

using Fuzz::require;

/// A description that was accepted becomes a file that says the same.
void checkFile(Orka::Topology const &topology) {
    static Fuzz::ScratchDirectory const directory;
    std::string const path = directory.at("made.array");
    Fuzz::removeFile(path);
    Orka::makeArrayFile(topology, path, Orka::Replace::Never);
    Orka::ArrayFile file(path);
    file.checkIntegrity();
    Orka::Inventory const inventory = file.inventory();
    require(inventory.arrays == topology.arrays, "the file holds the arrays");
    require(inventory.containers == topology.containers, "the file holds the containers");
    for (Orka::TopologyVolume const &told : topology.volumes) {
        Orka::VirtualVolume const &volume = told.volume;
        require(file.volume(volume.containerId, volume.uuid) == volume, "the file holds the volumes", volume.uuid);
        require(file.metadata(volume.containerId, volume.uuid) == told.metadata, "and their metadata", volume.uuid);
        file.unsharedChunks(volume.containerId, volume.uuid);
    }
    auto const bound = std::count_if(topology.volumes.begin(), topology.volumes.end(),
                                     [](auto const &told) { return told.volume.boundTo.has_value(); });
    require(file.boundVolumes().size() == static_cast<std::size_t>(bound), "the file knows what is bound");
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    Orka::Topology topology;
    try {
        topology = Orka::parseTopology(Fuzz::textOf(data, size), "lab.json");
    } catch (Wire::Failure const &failure) {
        require(failure.code() == Wire::ErrorCode::InvalidArgument, "a bad description is a bad argument",
                failure.sentence());
        Fuzz::requireSentence(failure.sentence());
        return 0;
    }
    checkFile(topology);
    return 0;
}
