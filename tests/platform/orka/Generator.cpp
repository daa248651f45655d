// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <cstdio>
#include <set>

#include <sys/wait.h>

#include "orka/Topology.h"

using namespace Orka;

namespace {

class GeneratedTopologies : public OrkaTest {
protected:
    /// @return what lab/generate-topology writes; `status_` its exit status
    std::string generate(std::string const &arguments) {
        auto const command = std::string(TOVI_LAB) + "/generate-topology " + arguments + " 2>/dev/null";
        FILE *const stream = popen(command.c_str(), "r");
        EXPECT_NE(stream, nullptr);
        std::string text;
        char buffer[4096];
        while (auto const count = fread(buffer, 1, sizeof buffer, stream)) {
            text.append(buffer, count);
        }
        int const status = pclose(stream);
        status_ = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
        return text;
    }

    int status_ = -1;
};

} // namespace

TEST_F(GeneratedTopologies, areTheSameBytesEveryTime) {
    std::string const arguments = "--containers 5 --arrays 2 --endpoints 3 --volumes 7 --metadata 2 --seed 9";
    auto const first = generate(arguments);
    EXPECT_EQ(status_, 0);
    EXPECT_EQ(generate(arguments), first);
    EXPECT_NE(generate("--containers 5 --arrays 2 --endpoints 3 --volumes 7 --metadata 2 --seed 10"), first);
}

TEST_F(GeneratedTopologies, doNotChangeFromVersionToVersion) {
    EXPECT_EQ(generate("--containers 1 --arrays 1 --endpoints 1 --volumes 1"),
              R"({
  "arrays": [
    {"id": "array-1", "name": "Array 1", "vendorId": "Tarsel", "modelId": "T-900", "endpoints": [{"uid": "pe-1-1", "type": "SCSI", "lunId": "naa.6660205dea77e87bb6be6bf720d481ec"}]}
  ],
  "containers": [
    {"id": "56fad969-9511-4f0b-9a3b-11c0502627f9", "name": "container-000001", "maxLumoSizeMb": 262144, "arrays": ["array-1"], "volumes": [
      {"uuid": "d831b286-df1f-4623-982c-c007911b3181", "directoryName": "vm-000001", "sizeMb": 61440, "committedMb": 59980, "unsharedMb": 29990, "profile": "policy-1"}
    ]}
  ]
}
)");
}

TEST_F(GeneratedTopologies, holdWhatWasAskedFor) {
    auto const topology =
        parseTopology(generate("--containers 4 --arrays 3 --endpoints 5 --volumes 10 --metadata 6"), "generated");
    ASSERT_EQ(topology.arrays.size(), 3U);
    for (auto const &array : topology.arrays) {
        EXPECT_EQ(array.endpoints.size(), 5U);
    }
    ASSERT_EQ(topology.containers.size(), 4U);
    for (auto const &container : topology.containers) {
        EXPECT_EQ(container.arrayIds, (std::vector<std::string>{"array-1", "array-2", "array-3"}));
    }
    ASSERT_EQ(topology.volumes.size(), 10U);
    std::set<std::string> containers;
    for (auto const &[volume, metadata] : topology.volumes) {
        EXPECT_EQ(metadata.size(), 6U);
        containers.insert(volume.containerId);
    }
    EXPECT_EQ(containers.size(), 4U);
}

TEST_F(GeneratedTopologies, mayBeEmpty) {
    EXPECT_EQ(parseTopology(generate("--containers 0 --arrays 0 --endpoints 0"), "generated"), Topology{});
    auto const topology = parseTopology(generate("--containers 2 --arrays 0 --endpoints 0"), "generated");
    EXPECT_EQ(topology.containers.size(), 2U);
}

TEST_F(GeneratedTopologies, areRefusedForArgumentsThatMakeNoSense) {
    for (std::string const arguments :
         {"", "--containers 1 --arrays 1", "--containers -1 --arrays 1 --endpoints 1",
          "--containers x --arrays 1 --endpoints 1", "--containers 0 --arrays 1 --endpoints 1 --volumes 1"}) {
        EXPECT_EQ(generate(arguments), "");
        EXPECT_EQ(status_, 2) << arguments;
    }
}
