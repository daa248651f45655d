// SPDX-License-Identifier: Apache-2.0
//
// Runs two commands in turns and prints how long each run took, start to exit, in nanoseconds: one line a round, the
// first command's time and the second's. Turns, because a machine's pace drifts: what slows one slows the other.
//
//   bench_pair ROUNDS FIRST... -- SECOND...
//
// Both get an empty standard input and write nowhere. A command that fails ends the measurement: the time of a failure
// is not the time of the work.
#include <cerrno>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <spawn.h>
#include <string_view>
#include <sys/wait.h>
#include <vector>

extern char **environ;

namespace {

using CommandLine = std::vector<char *>; // ends with a null, as posix_spawn wants it

/// Nanoseconds from start to exit; negative when the command could not be run or failed.
int64_t measure(CommandLine const &command) {
    posix_spawn_file_actions_t nowhere;
    posix_spawn_file_actions_init(&nowhere);
    posix_spawn_file_actions_addopen(&nowhere, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&nowhere, 1, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addopen(&nowhere, 2, "/dev/null", O_WRONLY, 0);
    auto const start = std::chrono::steady_clock::now();
    pid_t child = 0;
    int const failure = posix_spawnp(&child, command[0], &nowhere, nullptr, command.data(), environ);
    posix_spawn_file_actions_destroy(&nowhere);
    if (failure != 0) {
        std::fprintf(stderr, "bench_pair: %s: %s\n", command[0], std::strerror(failure));
        return -1;
    }
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    auto const taken = std::chrono::steady_clock::now() - start;
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        std::fprintf(stderr, "bench_pair: %s failed (wait status %d)\n", command[0], status);
        return -1;
    }
    return std::chrono::duration_cast<std::chrono::nanoseconds>(taken).count();
}

int usage() {
    std::fputs("usage: bench_pair ROUNDS FIRST... -- SECOND...\n", stderr);
    return 2;
}

} // namespace

int main(int argc, char **argv) {
    if (argc < 2) {
        return usage();
    }
    std::string_view const roundsText = argv[1];
    int rounds = 0;
    auto const parsed = std::from_chars(roundsText.data(), roundsText.data() + roundsText.size(), rounds);
    if (parsed.ec != std::errc() || parsed.ptr != roundsText.data() + roundsText.size() || rounds < 1) {
        return usage();
    }
    CommandLine first;
    CommandLine second;
    CommandLine *filling = &first;
    for (int i = 2; i < argc; ++i) {
        if (filling == &first && std::string_view(argv[i]) == "--") {
            filling = &second;
        } else {
            filling->push_back(argv[i]);
        }
    }
    if (first.empty() || second.empty()) {
        return usage();
    }
    first.push_back(nullptr);
    second.push_back(nullptr);

    // The first rounds read the programs into memory; they do not count.
    int const warmUps = 3;
    for (int round = -warmUps; round < rounds; ++round) {
        int64_t const a = measure(first);
        int64_t const b = a < 0 ? a : measure(second);
        if (a < 0 || b < 0) {
            return 1;
        }
        if (round >= 0) {
            std::printf("%lld %lld\n", static_cast<long long>(a), static_cast<long long>(b));
        }
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
