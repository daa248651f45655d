// SPDX-License-Identifier: Apache-2.0
#include "ProcessActivity.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/time.h>
#include <unistd.h>

#include "ExitStatus.h"
#include "FixedText.h"

namespace Tovicli {

namespace {

constexpr suseconds_t firstShownUs = 500'000;
constexpr suseconds_t redrawnUs = 200'000;
constexpr std::string_view eraseLine = "\r\x1b[K";

enum class Phase { Starting, Working, Writing };

// What the handlers read. Everything is set before the phase that makes them look at it.
std::atomic<Phase> phase{Phase::Starting};
std::atomic<bool> drawing{false}; ///< a handler on another thread is at it
std::atomic<bool> drawn{false};   ///< the line is on the screen
ProgressFunction progress = nullptr;
timespec started{};
bool machine = false;
std::array<char, 129> requestId{};

void writeOut(std::string_view text) {
    ssize_t const written = write(STDERR_FILENO, text.data(), text.size());
    static_cast<void>(written); // nobody is left to be told
}

std::uint64_t elapsedTenths() {
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    std::int64_t const tenths = (now.tv_sec - started.tv_sec) * 10 + (now.tv_nsec - started.tv_nsec) / 100'000'000;
    return static_cast<std::uint64_t>(std::max<std::int64_t>(tenths, 0));
}

/// A stopped terminal, or one that another process group has now, is left alone.
bool mayDraw() {
    pollfd terminal{STDERR_FILENO, POLLOUT, 0};
    return tcgetpgrp(STDERR_FILENO) == getpgrp() && poll(&terminal, 1, 0) == 1 && (terminal.revents & POLLOUT) != 0;
}

std::size_t columns() {
    winsize size{};
    return ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : 80;
}

/// "tovicli: working, 12.3 s, 250 of 1000 done"
FixedText progressLine() {
    std::uint64_t const tenths = elapsedTenths();
    FixedText line;
    line << "tovicli: working, " << tenths / 10 << "." << tenths % 10 << " s";
    std::uint64_t done = 0;
    std::uint64_t total = 0;
    if (progress != nullptr && progress(&done, &total)) {
        line << ", " << done;
        if (total != 0) {
            line << " of " << total;
        }
        line << " done";
    }
    line.cut(columns() - 1); // a full row would move the cursor to the next one
    return line;
}

extern "C" void drawProgress(int) {
    int const before = errno;
    if (!drawing.exchange(true)) {
        if (phase.load() == Phase::Working && mayDraw()) {
            FixedText frame;
            frame << "\r" << progressLine().text() << "\x1b[K";
            drawn.store(true);
            writeOut(frame.text());
        }
        drawing.store(false);
    }
    errno = before;
}

std::string_view nameOf(int signal) {
    return signal == SIGINT ? "interrupted" : signal == SIGTERM ? "terminated" : "hung up";
}

std::string_view whatWasDone() {
    switch (phase.load()) {
    case Phase::Working:
        return "; part of the work may have been done";
    case Phase::Writing:
        return "; the output may be cut short";
    default:
        return "";
    }
}

extern "C" void endBySignal(int signal) {
    FixedText text;
    if (drawn.load()) {
        text << eraseLine;
    }
    if (machine) {
        text << R"({"error":{"message":")" << nameOf(signal) << whatWasDone()
             << R"(","cause":null,"code":null,"hint":null,"requestId":")" << requestId.data()
             << "\",\"warnings\":[]}}\n";
    } else {
        text << "tovicli: " << nameOf(signal) << whatWasDone() << "\n";
    }
    writeOut(text.text());
    _exit(static_cast<int>(ExitStatus::EndedBySignal) + signal);
}

void setTimer(suseconds_t first, suseconds_t next) {
    itimerval const timer{{0, next}, {0, first}};
    setitimer(ITIMER_REAL, &timer, nullptr);
}

void takeOver(int signal) {
    struct sigaction before {};
    sigaction(signal, nullptr, &before);
    if (before.sa_handler != SIG_IGN) { // nohup, or a background job of a plain shell: keeps ignoring it
        struct sigaction action {};
        action.sa_handler = endBySignal;
        sigfillset(&action.sa_mask);
        sigaction(signal, &action, nullptr);
    }
}

} // namespace

ProcessActivity::ProcessActivity(bool terminal, bool outputTerminal)
    : terminal_(terminal)
    , outputTerminal_(outputTerminal) {
    for (int const signal : {SIGINT, SIGTERM, SIGHUP}) {
        takeOver(signal);
    }
}

ProcessActivity::~ProcessActivity() {
    if (phase.load() == Phase::Working) {
        end();
    }
}

void ProcessActivity::begin(Work const &work) {
    // The handlers are kept off while what they read changes.
    phase.store(Phase::Starting);
    machine = work.machine;
    std::size_t const length = std::min(work.requestId.size(), requestId.size() - 1);
    std::copy_n(work.requestId.begin(), length, requestId.begin());
    requestId[length] = '\0';
    progress = work.progress;
    bool const shows = terminal_ && work.mayShow && (outputTerminal_ || !work.machine);
    if (shows) {
        clock_gettime(CLOCK_MONOTONIC, &started);
    }
    phase.store(Phase::Working);
    if (shows) {
        struct sigaction action {};
        action.sa_handler = drawProgress;
        action.sa_flags = SA_RESTART;
        sigaction(SIGALRM, &action, nullptr);
        setTimer(firstShownUs, redrawnUs);
    }
}

void ProcessActivity::end() {
    phase.store(Phase::Writing);
    if (!terminal_) {
        return;
    }
    setTimer(0, 0);
    while (drawing.load()) { // on another thread, and about to see the phase
    }
    if (drawn.exchange(false)) {
        writeOut(eraseLine);
    }
}

} // namespace Tovicli
