// SPDX-License-Identifier: Apache-2.0
//
// A program as a process of its own, for tests that need a real one. The pipe of its standard output tells when it is
// ready, and waiting for its end needs no clock.
#pragma once

#include <string>
#include <vector>

#include <sys/types.h>

#include "wire/UniqueFd.h"

namespace LumodTest {

struct Ended {
    int status = -1; ///< the exit status; 128 and the signal for one that was killed
    std::string out;
    std::string err;
};

/// Runs until it ends or is told to; what is left of it goes with the object.
class Program {
public:
    /// @param environment the whole of it
    /// @param passed      descriptors that become 3 and those after it, as a service manager passes sockets
    Program(std::string const &path, std::vector<std::string> arguments, std::vector<std::string> environment = {},
            std::vector<int> const &passed = {});
    ~Program();
    Program(Program const &) = delete;
    Program &operator=(Program const &) = delete;

    /// The first line of standard output; empty when it ended without one.
    std::string firstLine();
    void signal(int number) const;
    pid_t pid() const {
        return pid_;
    }
    Ended wait();

private:
    pid_t pid_ = -1;
    Wire::UniqueFd out_;
    Wire::UniqueFd err_;
    std::string outText_;
};

} // namespace LumodTest
