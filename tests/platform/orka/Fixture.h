// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "orka/ArrayFile.h"
#include "orka/Topology.h"
#include "wire/Failure.h"

// What the array of makeArray() holds; docs/topology.md tells how.
inline constexpr char const *goldId = "00000000-0000-4000-8000-00000000000a";   // at most 8192 MB
inline constexpr char const *silverId = "00000000-0000-4000-8000-00000000000b"; // at most 100 MB
inline constexpr char const *noContainer = "00000000-0000-4000-8000-00000000000f";
inline constexpr char const *webId = "10000000-0000-4000-8000-000000000001";  // everything told
inline constexpr char const *bareId = "10000000-0000-4000-8000-000000000002"; // as little told as possible
inline constexpr char const *dataId = "10000000-0000-4000-8000-000000000003"; // bound to pe-1
inline constexpr char const *noVolume = "10000000-0000-4000-8000-00000000000f";
std::string const &sampleTopology();

/// A directory of its own for each test.
class OrkaTest : public ::testing::Test {
protected:
    OrkaTest();
    ~OrkaTest() override;

    std::string at(std::string const &name) const {
        return directory_ + '/' + name;
    }
    /// An array file of sampleTopology(), or of another topology.
    std::string makeArray(std::string const &name = "test.array",
                          std::optional<std::string> const &topology = std::nullopt) const;
    std::vector<std::string> filesInDirectory() const;

    std::string directory_;
};

std::string bytesOf(std::string const &path);
void writeBytes(std::string const &path, std::string const &bytes);

/// Ids that tell the order in which they were given: 20000000-0000-4000-8000-000000000001 and so on.
std::function<std::string()> countingUuids();

/// The sentence of the failure that a function ends with; empty when it succeeds.
std::string failureOf(std::function<void()> const &function);
Wire::ErrorCode codeOf(std::function<void()> const &function);

/// Another process's connection, as far as locks are concerned.
class Stranger {
public:
    explicit Stranger(std::string const &path);
    ~Stranger();
    Stranger(Stranger const &) = delete;
    Stranger &operator=(Stranger const &) = delete;

    void execute(std::string const &sql);

private:
    struct Handle;
    std::unique_ptr<Handle> handle_;
};
