// SPDX-License-Identifier: Apache-2.0
//
// The floor of the commands that ask the daemon for much: the requests that they send, serialized beforehand, and the
// bytes of the replies, looked at by nobody.
//
//   bench_replay record FILE checklumos CONTAINER        writes down the requests, and how many replies each one has
//   bench_replay record FILE metadata CONTAINER UUID
//   bench_replay FILE                                    sends them and reads the replies
//
// All on the daemon of TOVI_ROOT.
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "RawSession.h"

namespace {

using Words = std::vector<std::string>;

constexpr size_t idsARequest = 10000;

struct Exchange {
    std::vector<std::byte> request;
    size_t replyCount = 0;
};

class Recorder {
public:
    explicit Recorder(std::string const &socket)
        : session_(socket) {}

    void add(Bench::RawSession::Fill const &fill, Bench::RawSession::Look const &look = {}) {
        session_.prepare(fill, look);
        exchanges_.push_back({session_.request(), session_.replyCount()});
    }

    void write(std::string const &path) const {
        std::ofstream file(path, std::ios::binary);
        for (Exchange const &exchange : exchanges_) {
            size_t const head[2] = {exchange.request.size(), exchange.replyCount};
            file.write(reinterpret_cast<char const *>(head), sizeof(head));
            file.write(reinterpret_cast<char const *>(exchange.request.data()),
                       static_cast<std::streamsize>(exchange.request.size()));
        }
        if (!file.flush()) {
            throw std::runtime_error(path + " cannot be written");
        }
    }

private:
    Bench::RawSession session_;
    std::vector<Exchange> exchanges_;
};

/// Which config volumes are there, and whether each can be reached.
void recordChecklumos(Recorder &recorder, std::string const &container) {
    Words ids;
    recorder.add(
        [&container](Wire::Request::Builder request) {
            auto query = request.initQueryAllConfigLumos();
            query.setContainerId(container);
            query.setMax(INT32_MAX);
        },
        [&ids](Wire::Reply::Reader reply) {
            for (auto const lumo : reply.getConfigLumos()) {
                ids.emplace_back(lumo.getUuid().cStr());
            }
        });
    for (size_t first = 0; first < ids.size(); first += idsARequest) {
        recorder.add([&, first](Wire::Request::Builder request) {
            auto check = request.initCheckLumoAccessibility();
            check.setContainerId(container);
            size_t const count = std::min(idsARequest, ids.size() - first);
            auto list = check.initLumoIds(static_cast<unsigned>(count));
            for (size_t i = 0; i < count; ++i) {
                list.set(static_cast<unsigned>(i), ids[first + i]);
            }
        });
    }
}

void recordMetadata(Recorder &recorder, std::string const &container, std::string const &uuid) {
    recorder.add([&](Wire::Request::Builder request) {
        auto key = request.initGetLumoMetadata();
        key.setContainerId(container);
        key.setUuid(uuid);
    });
}

size_t replay(std::string const &socket, std::string const &path) {
    Bench::RawSession session(socket);
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

int run(Words const &words, std::string const &socket) {
    bool const records = words.size() >= 4 && words[0] == "record";
    if (records && words[2] == "checklumos" && words.size() == 4) {
        Recorder recorder(socket);
        recordChecklumos(recorder, words[3]);
        recorder.write(words[1]);
    } else if (records && words[2] == "metadata" && words.size() == 5) {
        Recorder recorder(socket);
        recordMetadata(recorder, words[3], words[4]);
        recorder.write(words[1]);
    } else if (words.size() == 1) {
        replay(socket, words[0]);
    } else {
        std::fputs("usage: TOVI_ROOT=DIR bench_replay FILE | record FILE checklumos CONTAINER | "
                   "record FILE metadata CONTAINER UUID\n",
                   stderr);
        return 2;
    }
    return 0;
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    try {
        return run(Words(argv + 1, argv + argc), std::string(root == nullptr ? "" : root) + "/run/lumod.sock");
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_replay: %s\n", error.what());
        return 1;
    }
}
