// SPDX-License-Identifier: Apache-2.0
#include "plugins/Trial.h"

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <exception>
#include <fcntl.h>
#include <poll.h>
#include <set>
#include <sys/wait.h>
#include <unistd.h>

#include "Commands.h"
#include "Descriptor.h"
#include "ElfFile.h"
#include "PlatformLibraries.h"
#include "plugins/Identity.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

using Clock = std::chrono::steady_clock;
using Root = boost::shared_ptr<AutoCli::Namespace>;
using EntryPoint = void (*)(Root &root);

/// A plug-in loaded into the trial's process; what it found out on the way.
struct Loaded {
    EntryPoint entry = nullptr;
    std::vector<Finding> findings;
};

std::string loaderText() {
    char const *const text = dlerror();
    return text != nullptr ? text : "unknown error";
}

/// @param descriptor the plug-in's file; stays open, since the system's loader knows libraries by path and inode
Loaded load(int descriptor, PlatformLibraries &platform) {
    Loaded loaded;
    if (std::string const problem = platform.provide(readElfFile(descriptor).needed); !problem.empty()) {
        loaded.findings.push_back({"library", problem});
        return loaded;
    }
    void *const library = dlopen(("/proc/self/fd/" + std::to_string(descriptor)).c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (library == nullptr) {
        loaded.findings.push_back({"load", loaderText()});
        return loaded;
    }
    std::set<std::string> missing;
    for (Symbol const &symbol : dynamicSymbols(descriptor)) {
        bool const mustBeThere = !symbol.defined && !symbol.weak;
        if (mustBeThere && dlsym(library, symbol.name.c_str()) == nullptr &&
            dlsym(RTLD_DEFAULT, symbol.name.c_str()) == nullptr) {
            missing.insert(symbol.name);
        }
    }
    for (std::string const &name : missing) {
        loaded.findings.push_back({"symbol", "nothing that it needs has the symbol " + name});
    }
    loaded.entry = reinterpret_cast<EntryPoint>(dlsym(library, "AutoCli_RegisterNamespaces"));
    if (loaded.entry == nullptr) {
        loaded.findings.push_back({"entry point", loaderText()});
    }
    return loaded;
}

Root emptyTree() {
    Root root = AutoCli::Namespace::New();
    root->SubNamespace("storage");
    root->SubNamespace("cli");
    return root;
}

/// @return why the entry point failed; empty when it did not
std::string registered(EntryPoint entry, Root &root) {
    try {
        entry(root);
        return {};
    } catch (std::exception const &failure) {
        return failure.what();
    } catch (...) {
        return "an exception of an unknown kind";
    }
}

std::set<std::string> commandPaths(AutoCli::NamespaceNode &node) {
    std::set<std::string> paths;
    for (KnownCommand const &known : commandsBelow(node)) {
        paths.insert(known.path);
    }
    return paths;
}

/// What keeps the plug-in from hanging its subtree into a tree where others have hung theirs.
std::vector<Finding> collisions(EntryPoint entry, std::set<std::string> const &own, Root &taken) {
    std::set<std::string> const before = commandPaths(*taken);
    std::string const problem = registered(entry, taken);
    std::vector<Finding> findings;
    if (!problem.empty()) {
        for (std::string const &path : own) {
            if (before.contains(path)) {
                findings.push_back({"name", "the command '" + path + "' is another plug-in's already"});
            }
        }
        findings.push_back({"name", problem});
    }
    return findings;
}

std::vector<Finding> tried(Question const &question, Descriptor const &file) {
    PlatformLibraries platform(question.libraryDirectory);
    Loaded plugin = load(file.number(), platform);
    if (!plugin.findings.empty()) {
        return plugin.findings;
    }
    Root alone = emptyTree();
    if (std::string const problem = registered(plugin.entry, alone); !problem.empty()) {
        return {{"registration", problem}};
    }
    Root taken = emptyTree();
    for (std::string const &earlier : question.earlier) {
        Inspected other = inspectFile(earlier);
        if (other.findings.empty()) {
            Loaded const loaded = load(other.file.number(), platform);
            other.file.keepForever();
            if (loaded.entry != nullptr) {
                static_cast<void>(registered(loaded.entry, taken)); // its own troubles are told elsewhere
            }
        }
    }
    return collisions(plugin.entry, commandPaths(*alone), taken);
}

/// The trial's process: its standard streams are nobody's, what it finds goes through the pipe.
[[noreturn]] void runTrial(Question const &question, Descriptor const &plugin, int toParent) {
    int const nowhere = open("/dev/null", O_RDWR | O_CLOEXEC);
    for (int const stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        dup2(nowhere, stream);
    }
    for (int const signal : {SIGINT, SIGTERM, SIGHUP}) {
        signal == SIGINT ? std::signal(signal, SIG_IGN) : std::signal(signal, SIG_DFL);
    }
    setenv("TOVI_OFFLINE", "1", 1);
    std::string text;
    for (Finding const &finding : tried(question, plugin)) {
        text += finding.check + '\0' + finding.detail + '\0';
    }
    text += '\0'; // came to its end
    std::size_t sent = 0;
    while (sent < text.size()) {
        ssize_t const written = write(toParent, text.data() + sent, text.size() - sent);
        if (written <= 0) {
            break;
        }
        sent += static_cast<std::size_t>(written);
    }
    _exit(0);
}

/// Everything that the trial says until it closes its end. @return false when it took too long
bool readAll(int descriptor, std::chrono::milliseconds timeout, std::string &text) {
    auto const deadline = Clock::now() + timeout;
    for (;;) {
        auto const left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
        pollfd waiting{descriptor, POLLIN, 0};
        int const ready = left > 0 ? poll(&waiting, 1, static_cast<int>(left)) : 0;
        if (ready == 0) {
            return false;
        }
        char buffer[4096];
        ssize_t const got = ready > 0 ? read(descriptor, buffer, sizeof(buffer)) : -1;
        if (got == 0) {
            return true;
        }
        if (got > 0) {
            text.append(buffer, static_cast<std::size_t>(got));
        } else if (errno != EINTR) {
            return true;
        }
    }
}

std::vector<Finding> findingsIn(std::string const &text) {
    std::vector<Finding> findings;
    std::size_t at = 0;
    while (at < text.size() && text[at] != '\0') {
        std::string const check = text.c_str() + at;
        at = std::min(at + check.size() + 1, text.size());
        std::string const detail = text.c_str() + at;
        at += detail.size() + 1;
        findings.push_back({check, detail});
    }
    return findings;
}

std::string endOf(int status) {
    if (WIFSIGNALED(status)) {
        return std::string("it ended the process that loaded it: ") + strsignal(WTERMSIG(status));
    }
    return "it ended the process that loaded it, with status " + std::to_string(WEXITSTATUS(status));
}

} // namespace

std::vector<Finding> tryOut(Question const &question, Descriptor const &plugin) {
    int ends[2] = {-1, -1};
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return {{"load", std::string("it cannot be tried: ") + std::strerror(errno)}};
    }
    Descriptor const fromTrial(ends[0]);
    pid_t const child = fork();
    if (child == 0) {
        runTrial(question, plugin, ends[1]);
    }
    close(ends[1]);
    if (child < 0) {
        return {{"load", std::string("it cannot be tried: ") + std::strerror(errno)}};
    }
    std::string text;
    bool const inTime = readAll(fromTrial.number(), question.timeout, text);
    if (!inTime) {
        kill(child, SIGKILL);
    }
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (!inTime) {
        return {{"registration", "it was not done within " + std::to_string(question.timeout.count()) + " ms"}};
    }
    if (text.empty() || text.back() != '\0' || !WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        return {{"load", endOf(status)}};
    }
    return findingsIn(text);
}

} // namespace Tovicli::Cli
