// SPDX-License-Identifier: Apache-2.0
#include "ProcessRun.h"

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

int ProcessRun::run(std::string const &program, std::vector<std::string> words,
                    std::function<void()> const &arrange) const {
    words.insert(words.begin(), program);
    std::vector<char *> arguments;
    for (std::string &word : words) {
        arguments.push_back(word.data());
    }
    arguments.push_back(nullptr);
    pid_t const child = fork();
    if (child == 0) {
        signal(SIGINT, SIG_DFL);
        dup2(open((files_ / "out").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600), STDOUT_FILENO);
        dup2(open((files_ / "err").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600), STDERR_FILENO);
        arrange();
        execv(program.c_str(), arguments.data());
        _exit(127);
    }
    int status = 0;
    while (waitpid(child, &status, 0) == -1 && errno == EINTR) {
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}
