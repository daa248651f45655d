// SPDX-License-Identifier: Apache-2.0
#include "DatabaseInput.h"
#include "SampleArray.h"
#include "SampleStore.h"
#include "Scratch.h"
#include "Seeds.h"
#include "orka/Topology.h"

namespace Fuzz {

void makeDatabaseSeeds(Keep const &arrayFiles, Keep const &hostStores) {
    ScratchDirectory const directory;
    std::string const array = directory.at("sample.array");
    Orka::makeArrayFile(Orka::parseTopology(sampleTopology, "topology"), array, Orka::Replace::Never);
    arrayFiles("sound", smallest(array));
    hostStores("sound", smallest(makeSampleStore(directory.path())));
}

} // namespace Fuzz
