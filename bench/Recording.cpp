// SPDX-License-Identifier: Apache-2.0
#include "Recording.h"

#include <fstream>
#include <stdexcept>
#include <utility>

#include "RawSession.h"

namespace Bench {

void writeRecording(std::string const &path, std::vector<Exchange> const &exchanges) {
    std::ofstream file(path, std::ios::binary);
    for (Exchange const &exchange : exchanges) {
        size_t const head[2] = {exchange.request.size(), exchange.replyCount};
        file.write(reinterpret_cast<char const *>(head), sizeof(head));
        file.write(reinterpret_cast<char const *>(exchange.request.data()),
                   static_cast<std::streamsize>(exchange.request.size()));
    }
    if (!file.flush()) {
        throw std::runtime_error(path + " cannot be written");
    }
}

size_t replayRecording(std::string const &socketPath, std::string const &path) {
    RawSession session(socketPath);
    std::ifstream file(path, std::ios::binary);
    size_t bytes = 0;
    size_t head[2];
    while (file.read(reinterpret_cast<char *>(head), sizeof(head))) {
        std::vector<std::byte> request(head[0]);
        if (!file.read(reinterpret_cast<char *>(request.data()), static_cast<std::streamsize>(request.size()))) {
            throw std::runtime_error(path + " ends early");
        }
        session.prepare(std::move(request), head[1]);
        bytes += session.ask();
    }
    if (bytes == 0) {
        throw std::runtime_error(path + " holds no requests");
    }
    return bytes;
}

} // namespace Bench
