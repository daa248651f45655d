// SPDX-License-Identifier: Apache-2.0
#include "shell/LineCompleter.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <dirent.h>
#include <fcntl.h>
#include <memory>
#include <poll.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "Descriptor.h"
#include "shell/Words.h"

namespace Tovicli::Cli {

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds patience{1500};
constexpr std::size_t mostShown = 100;

/// Everything that a process writes until it ends, or until it has taken too long; then it is ended.
std::string outputOf(std::vector<std::string> const &arguments) {
    int ends[2] = {-1, -1};
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return {};
    }
    Descriptor const reading(ends[0]);
    std::vector<char *> words;
    for (std::string const &argument : arguments) {
        words.push_back(const_cast<char *>(argument.c_str()));
    }
    words.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, ends[1], STDOUT_FILENO);
    posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    pid_t child = -1;
    int const problem = posix_spawn(&child, "/proc/self/exe", &actions, nullptr, words.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    close(ends[1]);
    if (problem != 0) {
        return {};
    }
    std::string text;
    auto const deadline = Clock::now() + patience;
    for (;;) {
        auto const left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
        pollfd waiting{reading.number(), POLLIN, 0};
        char bytes[4096];
        int const ready = left > 0 ? poll(&waiting, 1, static_cast<int>(left)) : 0;
        ssize_t const got = ready > 0 ? read(reading.number(), bytes, sizeof(bytes)) : ready;
        if (got > 0) {
            text.append(bytes, static_cast<std::size_t>(got));
        } else if (ready <= 0 || got == 0 || errno != EINTR) {
            break;
        }
    }
    kill(child, SIGKILL);
    while (waitpid(child, nullptr, 0) < 0 && errno == EINTR) {
    }
    return text;
}

std::vector<std::string> linesOf(std::string const &text) {
    std::vector<std::string> lines;
    std::size_t at = 0;
    while (at < text.size()) {
        std::size_t const end = std::min(text.find('\n', at), text.size());
        lines.push_back(text.substr(at, end - at));
        at = end + 1;
    }
    return lines;
}

/// Paths that begin with what is typed; a directory ends in a slash.
std::vector<std::pair<std::string, std::string>> pathsAt(std::string const &typed, bool directoriesOnly) {
    std::size_t const slash = typed.rfind('/');
    std::string const shown = slash == std::string::npos ? "" : typed.substr(0, slash + 1);
    std::string const begin = typed.substr(shown.size());
    auto const closeStream = [](DIR *stream) { closedir(stream); };
    std::unique_ptr<DIR, decltype(closeStream)> const stream(opendir(shown.empty() ? "." : shown.c_str()), closeStream);
    std::vector<std::pair<std::string, std::string>> paths;
    while (dirent const *entry = stream != nullptr ? readdir(stream.get()) : nullptr) {
        std::string const name = entry->d_name;
        if (!name.starts_with(begin) || (name[0] == '.' && begin.empty())) {
            continue;
        }
        struct stat status {};
        bool const isDirectory = stat((shown + name).c_str(), &status) == 0 && S_ISDIR(status.st_mode);
        if (isDirectory || !directoriesOnly) {
            paths.emplace_back(shown + name + (isDirectory ? "/" : ""), "");
        }
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

/// Characters of a text, which an editor counts in.
std::size_t charactersIn(std::string const &text) {
    return static_cast<std::size_t>(std::count_if(
        text.begin(), text.end(), [](char c) { return (static_cast<unsigned char>(c) & 0xC0U) != 0x80U; }));
}

std::string commonBegin(std::vector<std::pair<std::string, std::string>> const &values) {
    std::string begin = values.front().first;
    for (auto const &value : values) {
        auto const end = std::mismatch(begin.begin(), begin.end(), value.first.begin(), value.first.end()).first;
        begin.erase(end, begin.end());
    }
    while (!begin.empty() && (static_cast<unsigned char>(begin.back()) & 0xC0U) == 0x80U) {
        begin.pop_back(); // not in the middle of a character
    }
    return begin;
}

} // namespace

Answer askProgram(std::vector<std::string> const &words, std::string const &current) {
    std::vector<std::string> arguments{"tovicli", "cli", "complete"};
    for (std::string const &word : words) {
        arguments.push_back("--word=" + quotedWord(word));
    }
    arguments.push_back("--word=" + (current.empty() ? current : quotedWord(current)));
    Answer answer;
    for (std::string const &line : linesOf(outputOf(arguments))) {
        if (answer.kind.empty()) {
            answer.kind = line;
            continue;
        }
        std::size_t const tab = std::min(line.find('\t'), line.size());
        answer.values.emplace_back(line.substr(0, tab), tab < line.size() ? line.substr(tab + 1) : std::string());
    }
    return answer;
}

LineCompletion
lineCompletion(std::string const &upToCursor,
               std::function<Answer(std::vector<std::string> const &words, std::string const &current)> const &ask) {
    Unfinished line = splitUnfinished(upToCursor);
    if (!line.words.empty() && line.words.front() == "tovicli") {
        line.words.erase(line.words.begin());
    }
    Answer answer = ask(line.words, line.current);
    bool const isOption = line.current.starts_with("--");
    std::size_t const equals = isOption ? line.current.find('=') : std::string::npos;
    std::string const before = equals != std::string::npos ? line.current.substr(0, equals + 1) : std::string();
    std::string const typed = line.current.substr(before.size());
    if (answer.kind == "files" || answer.kind == "directories") {
        answer.values = pathsAt(typed, answer.kind == "directories");
    }
    LineCompletion completion;
    if (answer.values.empty()) {
        return completion;
    }
    completion.replaced = charactersIn(upToCursor.substr(line.begin));
    std::string const common = commonBegin(answer.values);
    if (answer.values.size() == 1) {
        completion.replacement = quotedWord(before + common) + (common.ends_with('/') ? "" : " ");
        return completion;
    }
    if (common.size() > typed.size() && quotedWord(before + common) == before + common) {
        completion.replacement = before + common;
        return completion;
    }
    for (auto const &[value, description] : answer.values) {
        if (completion.choices.size() == mostShown) {
            completion.choices.push_back("... and " + std::to_string(answer.values.size() - mostShown) + " more");
            break;
        }
        completion.choices.push_back("  " + value + (description.empty() ? "" : "  " + description));
    }
    return completion;
}

} // namespace Tovicli::Cli
