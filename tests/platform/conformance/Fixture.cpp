// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>

#include <unistd.h>

#include "orka/ProviderFactory.h"
#include "orka/Topology.h"
#include "orka/conformance/Bugs.h"

using namespace Orka::Conformance;

std::string const &wholeTopology() {
    static std::string const text = R"json({
  "arrays": [
    {"id": "array-1", "name": "One", "endpoints": [
      {"uid": "pe-1", "type": "SCSI", "lunId": "naa.1"},
      {"uid": "pe-2", "type": "NFS", "ipAddress": "192.0.2.2", "serverMount": "/two"},
      {"uid": "pe-down", "type": "SCSI", "accessible": false},
      {"type": -7}
    ]},
    {"id": "array-2", "endpoints": [{"uid": "pe-3", "type": "NFS4x", "addresses": ["192.0.2.3"]}]}
  ],
  "containers": [
    {"id": "00000000-0000-4000-8000-00000000000a", "name": "gold", "maxLumoSizeMb": 8192, "arrays": ["array-1"],
     "volumes": [
       {"uuid": "10000000-0000-4000-8000-000000000001", "directoryName": "web", "sizeMb": 1000, "committedMb": 500,
        "unsharedMb": 250, "profile": "fast", "blockSize": 4096, "metadata": [{"key": "k", "value": "1"}]},
       {"uuid": "10000000-0000-4000-8000-000000000002", "directoryName": "bare", "boundTo": "pe-1"},
       {"uuid": "10000000-0000-4000-8000-000000000003", "kind": "data", "boundTo": "pe-2"}
    ]},
    {"id": "00000000-0000-4000-8000-00000000000b", "name": "silver", "maxLumoSizeMb": 100, "arrays": ["array-2"]}
  ]
})json";
    return text;
}

namespace {

std::filesystem::path parentDirectory() {
    std::filesystem::path const memory = "/dev/shm";
    return access(memory.c_str(), W_OK | X_OK) == 0 ? memory : std::filesystem::temp_directory_path();
}

} // namespace

ConformanceTest::ConformanceTest() {
    std::string name = parentDirectory() / "orka-conformance.XXXXXX";
    if (mkdtemp(name.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    directory_ = name;
    makeArray();
}

ConformanceTest::~ConformanceTest() noexcept {
    std::error_code ignored;
    std::filesystem::remove_all(directory_, ignored);
}

void ConformanceTest::makeArray(std::string const &topology) {
    Orka::makeArrayFile(Orka::parseTopology(topology, "topology"), at("test.array"), Orka::Replace::ArrayFile);
}

std::unique_ptr<Orka::Provider> ConformanceTest::connect(std::string const &bug) {
    auto &timer = io_.provider->getTimer();
    auto provider = Orka::makeProvider(url(), {timer, nullptr});
    return bug.empty() ? std::move(provider) : makeBuggy(bug, std::move(provider), timer);
}

Surroundings ConformanceTest::surroundings(std::string const &bug) {
    return {io_.waitScope,
            io_.provider->getTimer(),
            [this, bug] { return connect(bug); },
            "test" + std::to_string(++runs_),
            20240229,
            10 * kj::SECONDS,
            nullptr,
            {TOVI_ORKA_CONFORMANCE, "--victim", url(), bug, ""}};
}

Report ConformanceTest::run(Surroundings surroundings, std::vector<std::string> const &beginnings) {
    Kit kit(std::move(surroundings));
    auto const failure = kit.reach();
    EXPECT_FALSE(failure) << failure->sentence();
    auto const isChosen = [&](std::string const &name) {
        return std::any_of(beginnings.begin(), beginnings.end(),
                           [&](std::string const &beginning) { return name.rfind(beginning, 0) == 0; });
    };
    return failure ? Report{} : kit.run(isChosen);
}

Orka::ArrayFileCounts ConformanceTest::counts() const {
    return Orka::ArrayFile(at("test.array")).counts();
}

std::string notPassed(Report const &report) {
    std::string text;
    for (auto const &result : report.results) {
        if (result.verdict != Verdict::Passed) {
            text +=
                result.title.name + ": expected " + result.expected + ", came " + result.came + result.reason + '\n';
        }
    }
    return text;
}
