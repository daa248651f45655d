// SPDX-License-Identifier: Apache-2.0
#include "Recording.h"

#include <cstdio>
#include <memory>
#include <stdexcept>
#include <utility>
#include <vector>

#include "RawSession.h"

namespace Bench {

size_t replayRecording(std::string const &socketPath, std::string const &path) {
    RawSession session(socketPath);
    std::unique_ptr<FILE, int (*)(FILE *)> const file(std::fopen(path.c_str(), "rbe"), std::fclose);
    if (!file) {
        throw std::runtime_error(path + " cannot be read");
    }
    size_t bytes = 0;
    RecordedHead head{};
    while (std::fread(&head, sizeof(head), 1, file.get()) == 1) {
        std::vector<std::byte> request(head.requestBytes);
        if (std::fread(request.data(), request.size(), 1, file.get()) != 1) {
            throw std::runtime_error(path + " ends early");
        }
        session.prepare(std::move(request), head.replyCount);
        bytes += session.ask();
    }
    if (bytes == 0) {
        throw std::runtime_error(path + " holds no requests");
    }
    return bytes;
}

} // namespace Bench
