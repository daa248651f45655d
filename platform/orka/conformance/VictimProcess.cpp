// SPDX-License-Identifier: Apache-2.0
#include "conformance/VictimProcess.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include "conformance/Expect.h"

namespace Orka::Conformance {

namespace {

[[noreturn]] void cannotStart(int reason) {
    throw Unmet{"a process that can be killed", "it cannot be started: " + std::generic_category().message(reason)};
}

struct Pipe {
    kj::AutoCloseFd reading;
    kj::AutoCloseFd writing;
};

Pipe makePipe() {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) {
        cannotStart(errno);
    }
    return {kj::AutoCloseFd(ends[0]), kj::AutoCloseFd(ends[1])};
}

/// The event loop blocks the signals that it waits for; a child must not inherit that.
class Attributes {
public:
    Attributes() {
        posix_spawnattr_init(&attributes_);
        sigset_t none;
        sigemptyset(&none);
        posix_spawnattr_setsigmask(&attributes_, &none);
        posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK);
    }
    ~Attributes() {
        posix_spawnattr_destroy(&attributes_);
    }
    Attributes(Attributes const &) = delete;
    Attributes &operator=(Attributes const &) = delete;

    posix_spawnattr_t const *get() const {
        return &attributes_;
    }

private:
    posix_spawnattr_t attributes_;
};

} // namespace

VictimProcess::VictimProcess(std::vector<std::string> words) {
    auto toChild = makePipe();
    auto fromChild = makePipe();
    std::vector<char *> arguments;
    for (auto &word : words) {
        arguments.push_back(word.data());
    }
    arguments.push_back(nullptr);
    Attributes const attributes;
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, toChild.reading.get(), STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&actions, fromChild.writing.get(), STDOUT_FILENO);
    int const reason = posix_spawn(&pid_, arguments[0], &actions, attributes.get(), arguments.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (reason != 0) {
        pid_ = -1;
        cannotStart(reason);
    }
    in_ = kj::mv(toChild.writing);
    out_ = kj::mv(fromChild.reading);
}

VictimProcess::~VictimProcess() noexcept {
    kill();
}

void VictimProcess::kill() noexcept {
    if (pid_ > 0) {
        ::kill(pid_, SIGKILL);
        while (waitpid(pid_, nullptr, 0) < 0 && errno == EINTR) {
        }
        pid_ = -1;
    }
}

void VictimProcess::awaitLine(std::string const &line, int timeoutMs) {
    auto const expected = "the process that is to be killed says \"" + line + '"';
    while (said_.find('\n') == std::string::npos) {
        pollfd waited{out_.get(), POLLIN, 0};
        int const ready = poll(&waited, 1, timeoutMs);
        if (ready < 0 && errno == EINTR) {
            continue;
        }
        expectTrue(expected, ready > 0, "nothing in time");
        std::array<char, 512> block{};
        auto const count = read(out_.get(), block.data(), block.size());
        expectTrue(expected, count > 0, said_.empty() ? std::string("its end") : show(said_));
        said_.append(block.data(), static_cast<size_t>(count));
    }
    auto const end = said_.find('\n');
    auto const came = said_.substr(0, end);
    said_.erase(0, end + 1);
    expectTrue(expected, came == line, show(came));
}

} // namespace Orka::Conformance
