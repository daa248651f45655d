// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace Bench {

/// A request, serialized, and how many replies it has.
struct Exchange {
    std::vector<std::byte> request;
    size_t replyCount = 0;
};

/// Both throw std::runtime_error for whatever goes wrong.
void writeRecording(std::string const &path, std::vector<Exchange> const &exchanges);

/// Sends the requests of a recording to the daemon behind the socket and reads their replies, one after the other.
/// @return the bytes read
size_t replayRecording(std::string const &socketPath, std::string const &path);

} // namespace Bench
