// SPDX-License-Identifier: Apache-2.0
//
// The tool on a terminal of its own, byte by byte: what it draws while a command works, and what it leaves.
#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <string>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

#include "TemporaryDirectory.h"

namespace {

using ::testing::HasSubstr;
using ::testing::MatchesRegex;
using ::testing::Not;

/// What is drawn comes five times a second.
constexpr int mostReads = 300;
constexpr char const *erased = "\r\x1b[K";

/// A command that works until the test lets it end, its standard streams on a terminal of the test's.
class Terminal : public ::testing::Test {
protected:
    Terminal() {
        place.addPlugin("behaves", "behaves.so");
        EXPECT_EQ(mkfifo(pipePath().c_str(), 0600), 0);
    }
    ~Terminal() override {
        if (child_ > 0) {
            kill(child_, SIGKILL);
            waitpid(child_, nullptr, 0);
        }
        if (terminal_ >= 0) {
            close(terminal_);
        }
    }

    struct Settings {
        char const *kind = "xterm";
        bool outputOnTerminal = true;
        std::vector<std::string> options = {};
        unsigned short columns = 80;
    };

    void start(Settings const &settings) {
        std::vector<std::string> words = {TEST_TOVICLI, "--plugins", place.path()};
        words.insert(words.end(), settings.options.begin(), settings.options.end());
        words.insert(words.end(), {"storage", "sample", "wait"});
        std::vector<char *> arguments;
        for (std::string &word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        std::string const pipe = pipePath();
        winsize const size{24, settings.columns, 0, 0};
        child_ = forkpty(&terminal_, nullptr, nullptr, &size);
        if (child_ == 0) {
            setenv("TEST_PIPE", pipe.c_str(), 1);
            setenv("TERM", settings.kind, 1);
            if (!settings.outputOnTerminal) {
                dup2(open("/dev/null", O_WRONLY), STDOUT_FILENO);
            }
            execv(TEST_TOVICLI, arguments.data());
            _exit(127);
        }
    }

    /// Reads what the terminal shows until it holds the text.
    void awaitText(std::string const &text) {
        for (int reads = 0; reads < mostReads && shown.find(text) == std::string::npos && readMore(10'000); ++reads) {
        }
        EXPECT_THAT(shown, HasSubstr(text));
    }
    /// What is shown within three times as long as it takes to show that work goes on.
    void watch() {
        while (readMore(1500)) {
        }
    }
    void letEnd() {
        int const pipe = open(pipePath().c_str(), O_WRONLY | O_CLOEXEC);
        EXPECT_EQ(write(pipe, "x", 1), 1);
        close(pipe);
    }
    void typeInterrupt() {
        EXPECT_EQ(write(terminal_, "\x03", 1), 1);
    }
    /// @return the exit status, or minus the signal that ended it
    int status() {
        int reads = 0;
        while (reads < mostReads && readMore(10'000)) {
            ++reads;
        }
        EXPECT_LT(reads, mostReads) << "it does not end";
        if (reads == mostReads) {
            kill(child_, SIGKILL);
        }
        int status = 0;
        waitpid(child_, &status, 0);
        child_ = -1;
        close(terminal_);
        terminal_ = -1;
        return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
    }
    pid_t child() const {
        return child_;
    }

    std::string shown;

private:
    bool readMore(int patienceMs) {
        pollfd waiting{terminal_, POLLIN, 0};
        char bytes[4096];
        ssize_t const count = poll(&waiting, 1, patienceMs) == 1 ? read(terminal_, bytes, sizeof(bytes)) : 0;
        shown.append(bytes, count > 0 ? static_cast<std::size_t>(count) : 0);
        return count > 0; // a terminal that the last process left fails with EIO
    }
    std::string pipePath() const {
        return place / "pipe";
    }

    TemporaryDirectory place;
    int terminal_ = -1;
    pid_t child_ = -1;
};

TEST_F(Terminal, LongWorkIsShownAndGoneBeforeTheResult) {
    start({});
    awaitText("\rtovicli: working, ");
    awaitText(" s\x1b[K\r");
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_THAT(shown, MatchesRegex("(\rtovicli: working, [0-9]+\\.[0-9] s\x1b\\[K)+\r\x1b\\[K7\r\n"));
}

TEST_F(Terminal, ShortWorkShowsNothing) {
    start({});
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_EQ(shown, "7\r\n");
}

TEST_F(Terminal, ALineNeverFillsTheRow) {
    start({"xterm", true, {}, 20});
    awaitText("working");
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_THAT(shown, HasSubstr("\rtovicli: working, 0\x1b[K"));
}

TEST_F(Terminal, NothingIsDrawnOnADumbTerminal) {
    start({"dumb"});
    watch();
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_EQ(shown, "7\r\n");
}

TEST_F(Terminal, NothingIsDrawnForAProgramThatReads) {
    start({"xterm", false, {"--format=json"}});
    watch();
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_EQ(shown, "");
}

TEST_F(Terminal, ItIsDrawnForAPersonWhoseOutputGoesElsewhere) {
    start({"xterm", false});
    awaitText("working");
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_TRUE(shown.ends_with(erased)) << shown;
}

TEST_F(Terminal, InterruptLeavesTheTerminalCleanAndSaysWhatMayBeDone) {
    start({});
    awaitText("working");
    typeInterrupt();
    EXPECT_EQ(status(), 130);
    // The terminal itself shows the key.
    EXPECT_TRUE(shown.ends_with(std::string(erased) + "tovicli: interrupted; part of the work may have been done\r\n"))
        << shown;
}

TEST_F(Terminal, TerminationAndHangUpDoTheSame) {
    for (auto const &[signal, name] : {std::pair(SIGTERM, "terminated"), std::pair(SIGHUP, "hung up")}) {
        shown.clear();
        start({});
        awaitText("working");
        kill(child(), signal);
        EXPECT_EQ(status(), 128 + signal);
        EXPECT_TRUE(
            shown.ends_with(std::string(erased) + "tovicli: " + name + "; part of the work may have been done\r\n"))
            << shown;
    }
}

TEST_F(Terminal, ATraceIsNotDrawnOver) {
    start({"xterm", true, {"--log-level=trivia"}});
    watch();
    letEnd();
    EXPECT_EQ(status(), 0);
    EXPECT_THAT(shown, HasSubstr("tovicli: trace: "));
    EXPECT_THAT(shown, Not(HasSubstr("working")));
}

} // namespace
