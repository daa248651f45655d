// SPDX-License-Identifier: Apache-2.0
#include "Program.h"

#include <csignal>
#include <stdexcept>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace LumodTest {

namespace {

std::vector<char *> pointers(std::vector<std::string> &texts) {
    std::vector<char *> result;
    for (std::string &text : texts) {
        result.push_back(text.data());
    }
    result.push_back(nullptr);
    return result;
}

std::string rest(int descriptor) {
    std::string text;
    char buffer[4096];
    for (ssize_t got = ::read(descriptor, buffer, sizeof buffer); got > 0;
         got = ::read(descriptor, buffer, sizeof buffer)) {
        text.append(buffer, static_cast<std::size_t>(got));
    }
    return text;
}

} // namespace

Program::Program(std::string const &path, std::vector<std::string> arguments, std::vector<std::string> environment,
                 std::vector<int> const &passed) {
    int out[2];
    int err[2];
    if (::pipe2(out, O_CLOEXEC) != 0 || ::pipe2(err, O_CLOEXEC) != 0) {
        throw std::runtime_error("pipe2");
    }
    arguments.insert(arguments.begin(), path);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, out[1], 1);
    posix_spawn_file_actions_adddup2(&actions, err[1], 2);
    for (std::size_t place = 0; place < passed.size(); ++place) {
        posix_spawn_file_actions_adddup2(&actions, passed[place], static_cast<int>(place) + 3);
    }
    if (!passed.empty()) {
        // LISTEN_PID must be the program's own number, which nobody knows before: the shell is that process.
        std::string command = "LISTEN_PID=$$ exec";
        for (std::string const &argument : arguments) {
            command += " " + argument;
        }
        arguments = {"/bin/sh", "-c", command};
    }
    if (::posix_spawn(&pid_, arguments.front().c_str(), &actions, nullptr, pointers(arguments).data(),
                      pointers(environment).data()) != 0) {
        throw std::runtime_error("posix_spawn " + arguments.front());
    }
    posix_spawn_file_actions_destroy(&actions);
    ::close(out[1]);
    ::close(err[1]);
    out_.reset(out[0]);
    err_.reset(err[0]);
}

Program::~Program() {
    if (pid_ > 0) {
        ::kill(pid_, SIGKILL);
        ::waitpid(pid_, nullptr, 0);
    }
}

std::string Program::firstLine() {
    char byte = 0;
    while (::read(out_.get(), &byte, 1) == 1 && byte != '\n') {
        outText_ += byte;
    }
    return outText_;
}

void Program::signal(int number) const {
    ::kill(pid_, number);
}

Ended Program::wait() {
    Ended ended{-1, outText_ + rest(out_.get()), rest(err_.get())};
    int status = 0;
    ::waitpid(pid_, &status, 0);
    pid_ = -1;
    ended.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    return ended;
}

} // namespace LumodTest
