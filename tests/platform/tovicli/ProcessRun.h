// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "TemporaryDirectory.h"

/// Runs a program with standard output and error in files.
class ProcessRun {
public:
    /// @param arrange called in the new process before the program starts
    /// @return the exit status, or minus the signal that ended it
    int run(
        std::string const &program, std::vector<std::string> words, std::function<void()> const &arrange = [] {}) const;
    std::string output() const {
        return readFile(files_ / "out");
    }
    std::string errors() const {
        return readFile(files_ / "err");
    }

private:
    TemporaryDirectory files_;
};
