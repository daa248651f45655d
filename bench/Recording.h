// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

namespace Bench {

/// What stands before each request of a recording, in the machine's own byte order: its bytes, and how many replies it
/// has. bench_record writes recordings.
struct RecordedHead {
    size_t requestBytes;
    size_t replyCount;
};

/// Sends the requests of a recording to the daemon behind the socket and reads their replies, one after the other.
/// Throws std::runtime_error for whatever goes wrong. @return the bytes read
size_t replayRecording(std::string const &socketPath, std::string const &path);

} // namespace Bench
