// SPDX-License-Identifier: Apache-2.0
//
// The power goes at every moment of a story; what was acknowledged is there afterwards, and nothing is half done.
#include "PowerCut.h"

#include <cstdlib>
#include <filesystem>
#include <functional>
#include <optional>
#include <stdexcept>

#include <gtest/gtest.h>
#include <unistd.h>

#include "orka/ArrayFile.h"
#include "orka/Topology.h"
#include "store/HostStore.h"

namespace {

constexpr char const *containerId = "00000000-0000-4000-8000-00000000000a";
constexpr char const *volumeId = "10000000-0000-4000-8000-000000000001";

class PowerCutTest : public ::testing::Test {
protected:
    PowerCutTest() {
        // In memory where that is to be had: what a disk keeps is told by the notes, not by the real files' syncs.
        bool const hasMemory = ::access("/dev/shm", W_OK | X_OK) == 0;
        std::string pattern = (hasMemory ? "/dev/shm" : std::filesystem::temp_directory_path().string()) +
                              std::string("/tovi-power-XXXXXX");
        if (::mkdtemp(pattern.data()) == nullptr) {
            throw std::runtime_error("no temporary directory");
        }
        directory_ = pattern;
        std::filesystem::create_directory(live());
    }
    ~PowerCutTest() override {
        std::filesystem::remove_all(directory_);
    }

    std::string live() const {
        return directory_ + "/live";
    }
    std::string after() const {
        return directory_ + "/after";
    }

    /// How many disks with torn writes are looked at for each moment.
    static int tornDisks() {
        return std::getenv("TOVI_LONG") != nullptr ? 60 : 3;
    }

    /// @param steps   each one acknowledged when it returns
    /// @param stateOf what a directory holds, in words
    void cutEverywhere(std::vector<std::function<void()>> const &steps,
                       std::function<std::string(std::string const &directory)> const &stateOf) {
        std::vector<std::string> states = {stateOf(live())};
        {
            PowerCut cut(live());
            for (std::function<void()> const &step : steps) {
                step();
                cut.acknowledge();
                states.push_back(stateOf(live()));
            }
            cut.stop();
            ASSERT_GT(cut.moments(), steps.size() * 10) << "the story was not noted";
            std::mt19937 random(20240229); // NOLINT(cert-msc32-c,cert-msc51-cpp): the same disks each time
            for (std::size_t moment = 0; moment < cut.moments(); ++moment) {
                checkMoment(cut, moment, PowerCut::Unsynced::Lost, random, states, stateOf);
                checkMoment(cut, moment, PowerCut::Unsynced::Written, random, states, stateOf);
                for (int disk = 0; disk < tornDisks(); ++disk) {
                    checkMoment(cut, moment, PowerCut::Unsynced::Torn, random, states, stateOf);
                }
            }
        }
        EXPECT_GT(rolledBack_, 0) << "no journal had to be rolled back; the cuts prove nothing";
    }

private:
    void checkMoment(PowerCut const &cut, std::size_t moment, PowerCut::Unsynced unsynced, std::mt19937 &random,
                     std::vector<std::string> const &states,
                     std::function<std::string(std::string const &directory)> const &stateOf) {
        cut.layOut(moment, unsynced, random, after());
        std::size_t const done = cut.acknowledgedAt(moment);
        std::string const next = done + 1 < states.size() ? states[done + 1] : states[done];
        SCOPED_TRACE("moment " + std::to_string(moment) + " of " + std::to_string(cut.moments()) + ", " +
                     std::to_string(done) + " acknowledged, way " + std::to_string(static_cast<int>(unsynced)));
        bool const hadJournal = hasJournal();
        std::string state;
        ASSERT_NO_THROW(state = stateOf(after()));
        EXPECT_TRUE(state == states[done] || state == next) << state << "--- expected\n"
                                                            << states[done] << "--- or\n"
                                                            << next;
        rolledBack_ += hadJournal && !hasJournal() ? 1 : 0;
    }

    bool hasJournal() const {
        for (auto const &entry : std::filesystem::directory_iterator(after())) {
            if (entry.path().string().find("-journal") != std::string::npos) {
                return true;
            }
        }
        return false;
    }

    std::string directory_;
    int rolledBack_ = 0;
};

std::string stateOfStore(std::string const &root) {
    Store::HostStore store(root, Store::HostStore::Mode::QueryOnly);
    std::string state;
    for (Store::Provider const &provider : store.providers()) {
        state += "provider " + provider.name + ' ' + provider.url + ' ' + std::to_string(provider.arrays.size()) + '\n';
    }
    for (Store::FileSystem const &fileSystem : store.fileSystems()) {
        state += "container " + fileSystem.name + ' ' + fileSystem.containerId + '\n';
    }
    for (Store::Mount const &mount : store.mounts()) {
        state += "mount " + mount.volumeUuid + ' ' + mount.directoryName + '\n';
    }
    for (std::string const &uid : store.endpointOutages()) {
        state += "outage " + uid + '\n';
    }
    return state + "context " + store.orkaContext().value_or("none") + '\n';
}

TEST_F(PowerCutTest, fault_45_TheHostStoreHoldsWhatWasAcknowledged) {
    Store::HostStore store(live(), Store::HostStore::Mode::ReadWrite);
    std::vector<Store::Provider> many;
    for (int number = 0; number < 40; ++number) {
        many.push_back({"vp-" + std::to_string(number), "file:///" + std::string(200, 'x'), "text", {{"a1", true, 1}}});
    }
    Store::Volume const volume{volumeId, containerId, "vm", Store::VolumeState::Mounting};
    cutEverywhere({[&] {
                       store.putProviders({{"lab", "file:///lab.array", "", {{"a1", true, 1}, {"a2", false, 2}}}});
                   },
                   [&] { store.putProviders(many); },
                   [&] {
                       store.addFileSystem({"gold", containerId, {"a1"}});
                   },
                   [&] { store.putVolumes({volume}, {}); }, [&] { store.setEndpointOutage("pe-1", true); },
                   [&] { store.setOrkaContext("11111111-2222-3333-4444-555555555555"); },
                   [&] { store.removeProvider("vp-7"); },
                   [&] {
                       Store::HostStore::Change change(store);
                       store.putVolumes({{volumeId, containerId, "vm", Store::VolumeState::Unmounting}}, {volume});
                       change.commit();
                   }},
                  stateOfStore);
}

std::string stateOfArray(std::string const &directory) {
    Orka::ArrayFile file(directory + "/one.array");
    file.checkIntegrity();
    std::string state;
    for (Orka::ConfigVolume const &volume : file.configVolumes(containerId, 1000)) {
        state += volume.directoryName + ' ' + volume.boundTo.value_or("unbound") + '\n';
    }
    return state + "context " + file.hostContext().value_or("none") + '\n';
}

TEST_F(PowerCutTest, fault_45_AnArrayFileHoldsWhatWasAcknowledged) {
    std::string const path = live() + "/one.array";
    Orka::makeArrayFile(
        Orka::parseTopology(R"({"arrays": [{"id": "a1", "endpoints": [{"uid": "pe-1", "type": "SCSI"}]}],
        "containers": [{"id": "00000000-0000-4000-8000-00000000000a", "name": "gold", "maxLumoSizeMb": 8192, "arrays": ["a1"]}]})",
                            "one"),
        path, Orka::Replace::Never);
    std::optional<Orka::ArrayFile> file;
    Orka::VolumeSpec spec;
    spec.containerId = containerId;
    spec.directoryName = "vm";
    std::string made;
    cutEverywhere({[&] {
                       file.emplace(path); // from here on under the eyes of the cut
                       made = file->createVolume("key-1", spec).uuid;
                   },
                   [&] { file->bindVolume("key-2", containerId, made, "pe-1"); },
                   [&] {
                       spec.directoryName = "other";
                       file->createVolume("key-3", spec);
                   },
                   [&] { file->unbindVolume("key-4", containerId, made); },
                   [&] { file->deleteVolume("key-5", containerId, made); }, [&] { file->setHostContext("c"); }},
                  stateOfArray);
}

} // namespace
