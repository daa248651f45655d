// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Tovicli {

/// Reads how far a call has come; false while nothing is counted, a total of 0 while it is unknown. Also called in a
/// signal handler. As lumolib/Progress.h declares it.
using ProgressFunction = bool (*)(uint64_t *done, uint64_t *total);

/// What somebody who waits for a run sees of it, and what is told when a signal ends it: the process, or a test.
class Activity {
public:
    struct Work {
        /// Null when nobody counts.
        ProgressFunction progress = nullptr;
        /// Whether the elapsed time may be shown, where there is a terminal to show it on.
        bool mayShow = true;
        /// How an end by a signal is told: a line for people or an error document.
        bool machine = false;
        std::string requestId;
    };

    virtual ~Activity() = default;
    /// A command begins: from now on the host may be changed.
    virtual void begin(Work const &work) = 0;
    /// It has returned: what was shown is taken away. What is left is to write its result.
    virtual void end() = 0;
};

} // namespace Tovicli
