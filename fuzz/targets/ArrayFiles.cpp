// SPDX-License-Identifier: Apache-2.0
//
// An array file that anybody may have written (DatabaseInput.h tells what an input is), opened as the embedded provider
// does: it is refused, or everything in it is what a storage array may say, and changing it goes well or fails.
#include <functional>
#include <string>
#include <vector>

#include "DatabaseInput.h"
#include "Property.h"
#include "SampleArray.h"
#include "Scratch.h"
#include "orka/ArrayFile.h"
#include "orka/Topology.h"
#include "wire/ContainerId.h"

namespace {

using Fuzz::require;
using namespace Orka;

struct Sample {
    Sample() {
        makeArrayFile(parseTopology(Fuzz::sampleTopology, "topology"), path(), Replace::Never);
        bytes = Fuzz::smallest(path());
    }
    std::string path() const {
        return directory.at("sample.array");
    }

    Fuzz::ScratchDirectory directory;
    std::string bytes;
};

/// Every operation fails with a declared failure or does what it says.
void attempt(std::function<void()> const &operation) {
    try {
        operation();
    } catch (Wire::Failure const &failure) {
        Fuzz::requireFailure(failure);
    }
}

void checkId(std::string const &id) {
    require(Wire::normalizeContainerId(id) == id, "an id is canonical", id);
}

void checkVolume(VirtualVolume const &volume) {
    checkId(volume.uuid);
    checkId(volume.containerId);
    require(volume.kind == VolumeKind::Config || volume.kind == VolumeKind::Data, "a volume is of one of the kinds");
    require(volume.sizeMb >= 0 && volume.committedMb >= 0 && volume.unsharedMb.value_or(0) >= 0,
            "sizes are not negative", volume.uuid);
    require(volume.blockSize > 0, "a block has a size", volume.uuid);
}

void askAboutVolume(ArrayFile &file, std::string const &container, std::string const &uuid) {
    attempt([&] { checkVolume(file.volume(container, uuid)); });
    attempt([&] { file.spaceStats(container, uuid); });
    attempt([&] { file.metadata(container, uuid); });
    attempt([&] {
        auto const bits = static_cast<int64_t>(file.unsharedChunks(container, uuid).bitmap.size()) * 8;
        require(bits <= UnsharedChunks::maxChunks, "a bitmap covers no more than an answer does", uuid);
    });
}

void askAbout(ArrayFile &file, StorageContainer const &container) {
    checkId(container.id);
    require(container.maxLumoSizeMb >= 0, "a size is not negative", container.id);
    std::vector<std::string> uuids{"11111111-2222-3333-4444-555555555555"};
    attempt([&] {
        for (ConfigVolume const &volume : file.configVolumes(container.id, 10)) {
            checkId(volume.uuid);
            uuids.push_back(volume.uuid);
        }
    });
    attempt([&] {
        require(file.presence(container.id, uuids).size() == uuids.size(), "every id is answered for", container.id);
    });
    attempt([&] { file.volumeByDirectoryName(container.id, "directory"); });
    for (std::string const &uuid : uuids) {
        askAboutVolume(file, container.id, uuid);
    }
}

void change(ArrayFile &file) {
    std::string const container = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
    std::string const uuid = "11111111-2222-3333-4444-555555555555";
    attempt([&] { file.bindVolume("bind", container, uuid, "endpoint"); });
    attempt([&] { file.unbindVolume("", container, uuid); });
    attempt([&] {
        VolumeSpec spec;
        spec.containerId = container;
        spec.directoryName = "new";
        VirtualVolume const made = file.createVolume("create", spec);
        checkVolume(made);
        require(file.createVolume("create", spec).uuid == made.uuid, "a repetition gives the first answer");
    });
    attempt([&] { file.deleteVolume("delete", container, uuid); });
    attempt([&] { file.setHostContext("context"); });
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    static Sample const sample;
    Fuzz::putDatabase(sample.path(), sample.bytes, Fuzz::textOf(data, size));
    attempt([&] {
        unsigned made = 0;
        ArrayFile file(sample.path(), std::chrono::milliseconds(0),
                       [&made] { return "00000000-0000-4000-8000-00000000000" + std::to_string(++made % 10); });
        attempt([&] { file.checkIntegrity(); });
        attempt([&] { file.counts(); });
        attempt([&] { file.hostContext(); });
        attempt([&] {
            for (VirtualVolume const &volume : file.boundVolumes()) {
                checkVolume(volume);
            }
        });
        attempt([&] {
            for (StorageContainer const &container : file.inventory().containers) {
                askAbout(file, container);
            }
        });
        change(file);
    });
    return 0;
}
