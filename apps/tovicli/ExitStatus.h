// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

namespace Tovicli {

/// What the process ends with. Scripts rely on the numbers.
enum class ExitStatus : int {
    Completed = 0,
    /// The command reported a failure.
    Failed = 1,
    /// A mistake in the command line.
    Usage = 2,
    /// The daemon or a plug-in is not to be had.
    Unavailable = 3,
    /// The output could not be written; the work may have been done.
    Unwritten = 4,
    /// Plus the signal's number, as shells count.
    EndedBySignal = 128,
    /// The same for SIGINT, which Ctrl-C sends.
    Interrupted = 130,
};

/// One status and what it means, for help and manual.
struct ExitMeaning {
    char const *status;
    char const *meaning;
};

constexpr std::array<ExitMeaning, 6> exitMeanings{{
    {"0", "completed"},
    {"1", "the command reported a failure: output left incomplete, a false result, a message"},
    {"2", "usage: a mistake in the command line; nothing was done"},
    {"3", "the daemon or a plug-in is not to be had, or did not answer in time"},
    {"4", "the output could not be written; the work may have been done"},
    {"128+n", "ended by signal n (129 SIGHUP, 130 SIGINT or Ctrl-C, 143 SIGTERM); part of the work may have been done"},
}};

} // namespace Tovicli
