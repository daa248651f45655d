// SPDX-License-Identifier: Apache-2.0
//
// The floor of the commands that ask the daemon for much: the requests that they send, serialized beforehand, and the
// bytes of the replies, looked at by nobody.
//
//   bench_replay record FILE checklumos CONTAINER        writes down the requests, and how many replies each one has
//   bench_replay record FILE metadata CONTAINER UUID
//   bench_replay record FILE containers
//   bench_replay FILE                                    sends them and reads the replies
//
// All on the daemon of TOVI_ROOT.
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>
#include <vector>

#include "RawSession.h"
#include "Recording.h"

namespace {

using Words = std::vector<std::string>;

constexpr size_t idsARequest = 10000;

class Recorder {
public:
    explicit Recorder(std::string const &socket)
        : session_(socket) {}

    void add(Bench::RawSession::Fill const &fill, Bench::RawSession::Look const &look = {}) {
        session_.prepare(fill, look);
        exchanges_.push_back({session_.request(), session_.replyCount()});
    }

    void write(std::string const &path) const {
        Bench::writeRecording(path, exchanges_);
    }

private:
    Bench::RawSession session_;
    std::vector<Bench::Exchange> exchanges_;
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

int run(Words const &words, std::string const &socket) {
    bool const records = words.size() >= 3 && words[0] == "record";
    if (records && words[2] == "checklumos" && words.size() == 4) {
        Recorder recorder(socket);
        recordChecklumos(recorder, words[3]);
        recorder.write(words[1]);
    } else if (records && words[2] == "metadata" && words.size() == 5) {
        Recorder recorder(socket);
        recordMetadata(recorder, words[3], words[4]);
        recorder.write(words[1]);
    } else if (records && words[2] == "containers" && words.size() == 3) {
        Recorder recorder(socket);
        recorder.add([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
        recorder.write(words[1]);
    } else if (words.size() == 1) {
        Bench::replayRecording(socket, words[0]);
    } else {
        std::fputs("usage: TOVI_ROOT=DIR bench_replay FILE | record FILE checklumos CONTAINER | "
                   "record FILE metadata CONTAINER UUID | record FILE containers\n",
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
