// SPDX-License-Identifier: Apache-2.0
//
// Runs two commands in turns and prints how long each run took, start to exit, in nanoseconds: one line a round, the
// first command's time and the second's. Turns, because a machine's pace drifts: what slows one slows the other.
//
//   bench_pair ROUNDS FIRST... -- SECOND...
//   bench_pair --memory FIRST... -- SECOND...     the most resident memory of each instead, in KiB, one line
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
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

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

/// The most memory that the command had resident, in KiB; negative when it failed. Forked, not spawned: until it has
/// become the program, a spawned process counts all of its parent's memory as its own.
long peakOf(CommandLine const &command) {
    pid_t const child = fork();
    if (child == 0) {
        int const nowhere = open("/dev/null", O_RDWR);
        for (int const fd : {0, 1, 2}) {
            dup2(nowhere, fd);
        }
        close(nowhere);
        execvp(command[0], command.data());
        _exit(127);
    }
    int status = 0;
    rusage usage{};
    if (child < 0 || wait4(child, &status, 0, &usage) != child || status != 0) {
        std::fprintf(stderr, "bench_pair: %s failed (wait status %d)\n", command[0], status);
        return -1;
    }
    return usage.ru_maxrss;
}

/// Prints the rounds' times. @return whether all went well
bool printTimes(CommandLine const &first, CommandLine const &second, int rounds) {
    // The first rounds read the programs into memory; they do not count.
    int const warmUps = 3;
    for (int round = -warmUps; round < rounds; ++round) {
        int64_t const a = measure(first);
        int64_t const b = a < 0 ? a : measure(second);
        if (a < 0 || b < 0) {
            return false;
        }
        if (round >= 0) {
            std::printf("%lld %lld\n", static_cast<long long>(a), static_cast<long long>(b));
        }
    }
    return true;
}

bool printPeaks(CommandLine const &first, CommandLine const &second) {
    long const a = peakOf(first);
    long const b = a < 0 ? a : peakOf(second);
    if (a < 0 || b < 0) {
        return false;
    }
    std::printf("%ld %ld\n", a, b);
    return true;
}

int usage() {
    std::fputs("usage: bench_pair ROUNDS|--memory FIRST... -- SECOND...\n", stderr);
    return 2;
}

} // namespace

int main(int argc, char **argv) {
    if (argc < 2) {
        return usage();
    }
    std::string_view const roundsText = argv[1];
    bool const isMemory = roundsText == "--memory";
    int rounds = 0;
    auto const parsed = std::from_chars(roundsText.data(), roundsText.data() + roundsText.size(), rounds);
    bool const isNumber = parsed.ec == std::errc() && parsed.ptr == roundsText.data() + roundsText.size();
    if (!isMemory && (!isNumber || rounds < 1)) {
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

    bool const isDone = isMemory ? printPeaks(first, second) : printTimes(first, second, rounds);
    return isDone && std::fflush(stdout) == 0 ? 0 : 1;
}
