// SPDX-License-Identifier: Apache-2.0
#pragma once

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
    Interrupted = 130,
};

} // namespace Tovicli
