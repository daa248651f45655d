// SPDX-License-Identifier: Apache-2.0
#include "Shell.h"

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <unistd.h>

#include "plexa/UsageError.h"
#include "shell/LineCompleter.h"
#include "shell/Words.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

constexpr char const *prompt = "tovicli> ";

/// TOVI_HISTORY, else tovicli/history in the directory of the user's state; empty when there is none to keep it in.
std::string historyFile() {
    if (char const *const chosen = std::getenv("TOVI_HISTORY")) {
        return chosen;
    }
    char const *const state = std::getenv("XDG_STATE_HOME");
    char const *const home = std::getenv("HOME");
    std::filesystem::path directory;
    if (state != nullptr && *state == '/') {
        directory = state;
    } else if (home != nullptr && *home == '/') {
        directory = std::filesystem::path(home) / ".local/state";
    } else {
        return {};
    }
    directory /= "tovicli";
    std::error_code problem;
    std::filesystem::create_directories(directory, problem);
    return problem ? std::string() : (directory / "history").string();
}

bool isEnd(std::vector<std::string> const &words) {
    return words.size() == 1 && (words[0] == "exit" || words[0] == "quit");
}

} // namespace

Shell::Shell(CliServices &services)
    : CliCommand(services) {
    SetDescription("Run many command lines in one process: typed, with history and completion, or from standard "
                   "input. A line holds the words behind 'tovicli', quoted as for a POSIX shell; '#' begins a comment; "
                   "'exit' ends.");
    SetMetaDataField("interactive", "true");
    AddExample("cli shell", "A prompt where standard input is a terminal; otherwise its lines are run.");
}

InputSpecPtr Shell::GetInputSpecInternal() {
    return declareParameters({
        {"keep-going", CallSpec::Flag, false,
         "Run what follows a line that failed too; the status is that of the first failure."},
    });
}

OutputSpecPtr Shell::GetOutputSpecInternal() {
    return declareResult(nullptr);
}

void Shell::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    bool const keepGoing = input->GetBool("keep-going");
    if (services_.isLine()) {
        throw UsageError("a shell is running already");
    }
    if (services_.isPrivileged()) {
        throw UsageError("a shell cannot be used: this program runs with rights that its caller lacks");
    }
    bool const isConversation = isatty(STDIN_FILENO) == 1 && isatty(STDERR_FILENO) == 1;
    std::unique_ptr<LineSource> const lines = isConversation ? terminalLines() : plainLines(STDIN_FILENO, {});
    services_.endWith(isConversation ? converse(*lines) : runAll(*lines, keepGoing));
    output->Complete();
}

std::unique_ptr<LineSource> Shell::terminalLines() {
    LineEditing const editing{prompt, historyFile(),
                              [](std::string const &upToCursor) { return lineCompletion(upToCursor, askProgram); }};
    std::string problem;
    std::unique_ptr<LineSource> lines = editedLines(editing, problem);
    if (!problem.empty()) {
        services_.warn(problem);
    }
    return lines;
}

/// Ends with the status of the last line, as shells do.
ExitStatus Shell::converse(LineSource &lines) {
    ExitStatus last = ExitStatus::Completed;
    for (;;) {
        Line const line = lines.next();
        if (line.kind == Line::Kind::End) {
            return last;
        }
        std::optional<ExitStatus> const status =
            line.kind == Line::Kind::Dropped ? std::nullopt : runLine(line, std::string());
        if (ended_ || status == ExitStatus::Unwritten) {
            return status.value_or(last);
        }
        last = status.value_or(last);
    }
}

/// Ends with the status of the first failure.
ExitStatus Shell::runAll(LineSource &lines, bool keepGoing) {
    ExitStatus first = ExitStatus::Completed;
    for (int64_t number = 1;; ++number) {
        Line const line = lines.next();
        if (line.kind == Line::Kind::End) {
            return first;
        }
        std::string const where = "line " + std::to_string(number);
        ExitStatus const status = runLine(line, where + ": ").value_or(ExitStatus::Completed);
        if (ended_) {
            return first;
        }
        if (status == ExitStatus::Completed) {
            continue;
        }
        first = first == ExitStatus::Completed ? status : first;
        if (!keepGoing || status == ExitStatus::Unwritten) {
            services_.warn("stopped at " + where + ", which failed");
            return first;
        }
    }
}

std::optional<ExitStatus> Shell::runLine(Line const &line, std::string const &where) {
    if (line.kind == Line::Kind::TooLong) {
        return services_.refuseLine(where + "the line is longer than 1 MiB");
    }
    try {
        std::vector<std::string> words = splitWords(line.text);
        if (!words.empty() && words.front() == "tovicli") {
            words.erase(words.begin()); // pasted from elsewhere
        }
        if (words.empty()) {
            return std::nullopt;
        }
        if (isEnd(words)) {
            ended_ = true;
            return std::nullopt;
        }
        return services_.runLine(words);
    } catch (UsageError const &mistake) {
        return services_.refuseLine(where + mistake.sentence());
    }
}

} // namespace Tovicli::Cli
