// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include <sys/types.h>

#include <kj/io.h>

namespace Orka::Conformance {

/// A process of the kit's own that performs one mutation, as orka/conformance/Victim.h tells. Killed and waited for
/// when this object goes, at the latest.
class VictimProcess {
public:
    /// @param words the program and what it is told. @throws Unmet when it cannot be started
    explicit VictimProcess(std::vector<std::string> words);
    ~VictimProcess() noexcept;
    VictimProcess(VictimProcess const &) = delete;
    VictimProcess &operator=(VictimProcess const &) = delete;

    /// Waits for its next line. @throws Unmet when it says something else, ends, or is silent for too long
    void awaitLine(std::string const &line, int timeoutMs);
    /// Ends it as a power cut would.
    void kill() noexcept;

private:
    pid_t pid_ = -1;
    kj::AutoCloseFd in_;  ///< what it reads; never written to, closed when it may end
    kj::AutoCloseFd out_; ///< what it says
    std::string said_;
};

} // namespace Orka::Conformance
