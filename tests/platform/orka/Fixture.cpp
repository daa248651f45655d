// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>

#include <sqlite3.h>

std::string const &sampleTopology() {
    static std::string const text = R"json({
  "arrays": [
    {"id": "array-1", "name": "One", "vendorId": "V1", "modelId": "M1", "endpoints": [
      {"uid": "pe-1", "type": "SCSI", "lunId": "naa.1"},
      {"uid": "pe-2", "type": "NFS", "ipAddress": "192.0.2.2", "serverMount": "/two", "configured": false},
      {"uid": "pe-down", "type": "SCSI", "accessible": false},
      {"type": -7}
    ]},
    {"id": "array-2", "endpoints": [
      {"uid": "pe-3", "type": "NFS4x", "addresses": ["192.0.2.3", "192.0.2.4"], "serverMount": "/three"},
      {"uid": "pe-4", "type": "NFS4x"}
    ]}
  ],
  "containers": [
    {"id": "00000000-0000-4000-8000-00000000000a", "name": "gold", "maxLumoSizeMb": 8192,
     "arrays": ["array-2", "array-1"], "volumes": [
       {"uuid": "10000000-0000-4000-8000-000000000001", "directoryName": "web", "sizeMb": 1000, "committedMb": 500,
        "unsharedMb": 250, "profile": "fast", "blockSize": 4096, "vmUuid": "vm-1",
        "metadata": [{"key": "k", "value": "1"}, {"key": "a", "value": ""}, {"key": "k", "value": "1"}]},
       {"uuid": "10000000-0000-4000-8000-000000000002", "directoryName": "bare"},
       {"uuid": "10000000-0000-4000-8000-000000000003", "kind": "data", "boundTo": "pe-1"}
    ]},
    {"id": "00000000-0000-4000-8000-00000000000b", "name": "silver", "maxLumoSizeMb": 100, "arrays": ["array-2"]}
  ]
})json";
    return text;
}

OrkaTest::OrkaTest() {
    std::string name = std::filesystem::temp_directory_path() / "orka-test.XXXXXX";
    if (mkdtemp(name.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    directory_ = name;
}

OrkaTest::~OrkaTest() {
    std::error_code ignored;
    std::filesystem::remove_all(directory_, ignored);
}

std::string OrkaTest::makeArray(std::string const &name, std::optional<std::string> const &topology) const {
    Orka::makeArrayFile(Orka::parseTopology(topology.value_or(sampleTopology()), "topology"), at(name),
                        Orka::Replace::Never);
    return at(name);
}

std::vector<std::string> OrkaTest::filesInDirectory() const {
    std::vector<std::string> names;
    for (auto const &entry : std::filesystem::directory_iterator(directory_)) {
        names.push_back(entry.path().filename());
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string bytesOf(std::string const &path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

void writeBytes(std::string const &path, std::string const &bytes) {
    std::ofstream(path, std::ios::binary | std::ios::trunc) << bytes;
}

std::function<std::string()> countingUuids() {
    return [count = 0]() mutable {
        char text[40];
        std::snprintf(text, sizeof text, "20000000-0000-4000-8000-%012d", ++count);
        return std::string(text);
    };
}

std::string failureOf(std::function<void()> const &function) {
    try {
        function();
    } catch (Wire::Failure const &failure) {
        return failure.sentence();
    }
    return "";
}

Wire::ErrorCode codeOf(std::function<void()> const &function) {
    try {
        function();
    } catch (Wire::Failure const &failure) {
        return failure.code();
    }
    return Wire::ErrorCode::Success;
}

struct Stranger::Handle {
    sqlite3 *database = nullptr;
};

Stranger::Stranger(std::string const &path)
    : handle_(std::make_unique<Handle>()) {
    EXPECT_EQ(sqlite3_open_v2(path.c_str(), &handle_->database, SQLITE_OPEN_READWRITE, nullptr), SQLITE_OK);
}

Stranger::~Stranger() {
    sqlite3_close(handle_->database);
}

void Stranger::execute(std::string const &sql) {
    char *error = nullptr;
    EXPECT_EQ(sqlite3_exec(handle_->database, sql.c_str(), nullptr, nullptr, &error), SQLITE_OK)
        << (error != nullptr ? error : "");
    sqlite3_free(error);
}
