// SPDX-License-Identifier: Apache-2.0
//
// The floor of the commands that ask the daemon for much: the requests that they send, serialized beforehand, and the
// bytes of the replies, looked at by nobody.
//
//   bench_replay RECORDING
//
// The recording is one of bench_record's, for the daemon of TOVI_ROOT.
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>

#include "Recording.h"

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    if (argc != 2 || root == nullptr) {
        std::fputs("usage: TOVI_ROOT=DIR bench_replay RECORDING\n", stderr);
        return 2;
    }
    try {
        Bench::replayRecording(std::string(root) + "/run/lumod.sock", argv[1]);
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_replay: %s\n", error.what());
        return 1;
    }
    return 0;
}
