// SPDX-License-Identifier: Apache-2.0
//
// The process around a run of the tool: descriptors, signals, where it lies, whom it serves.
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <new>
#include <string>
#include <string_view>
#include <sys/auxv.h>
#include <sys/ioctl.h>
#include <sys/random.h>
#include <unistd.h>
#include <vector>

#include "DescriptorSink.h"
#include "PluginLoader.h"
#include "ProcessActivity.h"
#include "Tool.h"

namespace {

/// The kernel takes back what a process had, and faster than nine libraries that clean up one by one. Where a process
/// is watched, what watches it reports at the regular end.
constexpr bool leavesAtOnce = !TOVI_WATCHED;

/// A file opened later must not take the place of a standard stream that the caller closed: what is written to the
/// stream would end up in it. The stand-ins fail every use, so that a closed output is still reported.
void occupyStandardDescriptors() {
    for (int const descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        if (fcntl(descriptor, F_GETFD) == -1 && errno == EBADF) {
            int const opened = open("/dev/null", descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY);
            if (opened != descriptor) {
                _exit(static_cast<int>(Tovicli::ExitStatus::Unwritten));
            }
        }
    }
}

/// A reader who has had enough makes a write fail, which is told as any other.
void ignoreClosedPipes() {
    struct sigaction action {};
    action.sa_handler = SIG_IGN;
    sigaction(SIGPIPE, &action, nullptr);
}

/// A terminal whose cursor can be moved back over what was written.
bool drawsLines(int descriptor) {
    char const *const kind = getenv("TERM");
    return isatty(descriptor) == 1 && kind != nullptr && *kind != '\0' && std::string_view(kind) != "dumb";
}

std::string directoryAbove(std::string const &path) {
    std::size_t const slash = path.rfind('/');
    return slash == std::string::npos || slash == 0 ? "/" : path.substr(0, slash);
}

std::string programDirectory() {
    char path[PATH_MAX];
    ssize_t const length = readlink("/proc/self/exe", path, sizeof(path));
    return length > 0 ? directoryAbove(std::string(path, static_cast<std::size_t>(length))) : "/usr/bin";
}

std::string workingDirectory() {
    char path[PATH_MAX];
    return getcwd(path, sizeof(path)) != nullptr ? path : "/";
}

/// 32 hexadecimal digits.
std::string randomRequestId() {
    unsigned char bytes[16] = {};
    if (getrandom(bytes, sizeof(bytes), 0) != static_cast<ssize_t>(sizeof(bytes))) {
        return "process-" + std::to_string(getpid());
    }
    constexpr char const *digits = "0123456789abcdef";
    std::string id;
    for (unsigned char const byte : bytes) {
        id += digits[byte >> 4];
        id += digits[byte & 0xF];
    }
    return id;
}

Plexa::Display outputDisplay(Tovicli::Environment const &environment) {
    winsize size{};
    bool const isTerminal = ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0;
    return Plexa::displayOf(isTerminal, size.ws_col,
                            [&environment](std::string const &name) { return environment.get(name); });
}

int run(int argc, char **argv) {
    occupyStandardDescriptors();
    ignoreClosedPipes();
    Tovicli::ProcessActivity activity(drawsLines(STDERR_FILENO), isatty(STDOUT_FILENO) == 1);
    std::string const installed = directoryAbove(programDirectory());
    Tovicli::DescriptorSink output(STDOUT_FILENO);
    Tovicli::DescriptorSink told(STDERR_FILENO);
    Plexa::StringSink untold;
    // A shell that completes a word has the user's line on the screen: nothing may be written into it.
    bool const completing = argc > 2 && Tovicli::CliHost::isCompletion({argv[1], argv[2]});
    Plexa::Sink &errors = completing ? static_cast<Plexa::Sink &>(untold) : told;
    Tovicli::ProcessEnvironment environment;
    Tovicli::PluginLoader plugins(installed + "/lib", geteuid());
    Plexa::Display const display = outputDisplay(environment);
    Tovicli::Context context{output,
                             errors,
                             environment,
                             plugins,
                             randomRequestId,
                             {installed + "/lib/tovicli/plugins", workingDirectory()},
                             display.width > 0 ? display.width : 80, // help always has a width
                             getauxval(AT_SECURE) != 0,
                             &activity,
                             {},
                             Tovicli::cliLibrary(installed + "/lib/tovicli/libtovicli-cli.so")};
    context.display = display;
    return static_cast<int>(Tovicli::Tool(context).run(std::vector<std::string>(argv, argv + argc)));
}

} // namespace

int main(int argc, char **argv) {
    int status = static_cast<int>(Tovicli::ExitStatus::Failed);
    try {
        status = run(argc, argv);
    } catch (std::bad_alloc const &) { // before there was anything to report it with
        std::fputs("tovicli: out of memory\n", stderr);
    }
    if (!leavesAtOnce) {
        return status;
    }
    std::fflush(nullptr); // what a plug-in may have written on its own
    _exit(status);
}
