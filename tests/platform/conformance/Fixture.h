// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <kj/async-io.h>

#include "orka/ArrayFile.h"
#include "orka/conformance/Kit.h"

/// An array with everything that a case can be tried on.
std::string const &wholeTopology();

/// An array file and an event loop of its own for each test, on a file system that needs no disk where there is one.
class ConformanceTest : public ::testing::Test {
protected:
    ConformanceTest();
    // KJ's destructors may throw; gtest's fixtures may not.
    ~ConformanceTest() noexcept override;

    std::string at(std::string const &name) const {
        return directory_ + '/' + name;
    }
    void makeArray(std::string const &topology = wholeTopology());
    std::string url() const {
        return "file://" + at("test.array");
    }
    /// A connection to the array, with a bug or without.
    std::unique_ptr<Orka::Provider> connect(std::string const &bug = "");
    Orka::Conformance::Surroundings surroundings(std::string const &bug = "");
    /// What came of the cases whose names begin with one of these.
    static Orka::Conformance::Report run(Orka::Conformance::Surroundings surroundings,
                                         std::vector<std::string> const &beginnings = {""});
    Orka::ArrayFileCounts counts() const;

    std::string directory_;
    int runs_ = 0;
    kj::AsyncIoContext io_ = kj::setupAsyncIo();
};

/// The cases that did not pass, a line each.
std::string notPassed(Orka::Conformance::Report const &report);
