// SPDX-License-Identifier: Apache-2.0
//
// Writes down, for floors to send, requests as bytes, and how many messages answer each one.
//
//   bench_record FILE checklumos CONTAINER
//   bench_record FILE metadata CONTAINER UUID
//   bench_record FILE containers
//   bench_record FILE ping
//
// All asked of the daemon of TOVI_ROOT once.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "PreparedSession.h"
#include "Recording.h"

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

    void add(Bench::PreparedSession::Fill const &fill, Bench::PreparedSession::Look const &look = {}) {
        session_.prepare(fill, look);
        exchanges_.push_back({session_.request(), session_.replyCount()});
    }

    void write(std::string const &path) const {
        std::ofstream file(path, std::ios::binary);
        for (Exchange const &exchange : exchanges_) {
            Bench::RecordedHead const head{exchange.request.size(), exchange.replyCount};
            file.write(reinterpret_cast<char const *>(&head), sizeof(head));
            file.write(reinterpret_cast<char const *>(exchange.request.data()),
                       static_cast<std::streamsize>(exchange.request.size()));
        }
        if (!file.flush()) {
            throw std::runtime_error(path + " cannot be written");
        }
    }

private:
    Bench::PreparedSession session_;
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

/// @return whether there is such a thing to record
bool record(Recorder &recorder, std::string const &what, Words const &keys) {
    if (what == "checklumos" && keys.size() == 1) {
        recordChecklumos(recorder, keys[0]);
    } else if (what == "metadata" && keys.size() == 2) {
        recordMetadata(recorder, keys[0], keys[1]);
    } else if (what == "containers" && keys.empty()) {
        recorder.add([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
    } else if (what == "ping" && keys.empty()) {
        recorder.add([](Wire::Request::Builder request) { request.setPing(); });
    } else {
        return false;
    }
    return true;
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    try {
        if (argc >= 3 && root != nullptr) {
            Recorder recorder(std::string(root) + "/run/lumod.sock");
            if (record(recorder, argv[2], Words(argv + 3, argv + argc))) {
                recorder.write(argv[1]);
                return 0;
            }
        }
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_record: %s\n", error.what());
        return 1;
    }
    std::fputs("usage: TOVI_ROOT=DIR bench_record FILE checklumos CONTAINER | FILE metadata CONTAINER UUID | "
               "FILE containers | FILE ping\n",
               stderr);
    return 2;
}
