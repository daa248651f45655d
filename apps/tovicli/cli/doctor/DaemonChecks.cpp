// SPDX-License-Identifier: Apache-2.0
#include "doctor/DaemonChecks.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <memory>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include "lumolib/Client.h"
#include "lumolib/LastFailure.h"
#include "lumolib/LumoLib.h"
#include "wire/Paths.h"
#include "wire/SocketAddress.h"

namespace Tovicli::Cli {

namespace {

using Clock = std::chrono::steady_clock;
using Containers = std::unique_ptr<StorageContainerResult, decltype(&LumoLib_FreeStorageContainerResult)>;

std::string user(uid_t uid) {
    return "user " + std::to_string(uid);
}

/// Connects to a socket and lets go of it again, without waiting. @return why that cannot be; empty when it can
std::string whyNotReached(std::string const &path, std::optional<ucred> &peer) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) {
        return errno == ENOENT ? "'" + path + "' does not exist: no daemon was started on this root"
                               : "'" + path + "' cannot be looked at: " + std::strerror(errno);
    }
    if (!S_ISSOCK(status.st_mode)) {
        return "'" + path + "' is no socket";
    }
    Wire::UniqueFd const socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
    Wire::SocketAddress const address(path);
    if (!socket || connect(socket.get(), address.get(), address.size()) != 0) {
        switch (errno) {
        case ECONNREFUSED:
            return "'" + path + "' is stale: no process listens on it";
        case EAGAIN:
            return "'" + path + "' has a daemon that takes no more connections: it hangs";
        case EACCES:
            return user(geteuid()) + " may not use '" + path + "', which belongs to " + user(status.st_uid) +
                   " and group " + std::to_string(status.st_gid);
        default:
            return "'" + path + "' cannot be connected to: " + std::strerror(errno);
        }
    }
    ucred credentials{};
    socklen_t size = sizeof(credentials);
    if (getsockopt(socket.get(), SOL_SOCKET, SO_PEERCRED, &credentials, &size) == 0) {
        peer = credentials;
    }
    return {};
}

bool checkSocket(std::string const &name, std::string const &path, Report &report) {
    std::optional<ucred> peer;
    std::string problem;
    try {
        problem = whyNotReached(path, peer);
    } catch (std::exception const &failure) {
        problem = failure.what();
    }
    if (!problem.empty()) {
        report.fail(name, problem);
        return false;
    }
    report.ok(name, "'" + path + "'" +
                        (peer ? ", process " + std::to_string(peer->pid) + " of " + user(peer->uid) : std::string()));
    return true;
}

/// "3 d 4 h", "2 min 5 s": the two largest units.
std::string age(std::chrono::milliseconds uptime) {
    int64_t const seconds = uptime.count() / 1000;
    auto const both = [](int64_t large, char const *one, int64_t small, char const *other) {
        return std::to_string(large) + one + std::to_string(small) + other;
    };
    if (seconds < 60) {
        return std::to_string(seconds) + " s";
    }
    if (seconds < 3600) {
        return both(seconds / 60, " min ", seconds % 60, " s");
    }
    if (seconds < 86400) {
        return both(seconds / 3600, " h ", seconds % 3600 / 60, " min");
    }
    return both(seconds / 86400, " d ", seconds % 86400 / 3600, " h");
}

std::string canonical(std::string const &path) {
    std::unique_ptr<char, decltype(&std::free)> const resolved(realpath(path.c_str(), nullptr), &std::free);
    return resolved != nullptr ? resolved.get() : path;
}

bool checkAnswer(DaemonQuestion const &question, Report &report) {
    LumoClient::Settings settings = LumoClient::Settings::fromEnvironment();
    settings.root = question.root;
    settings.timeout = question.timeout;
    settings.offline = false;
    try {
        LumoClient::DaemonStatus const status = LumoClient::Client(settings).ping();
        report.ok("peer rights", user(geteuid()) + " is admitted");
        std::string const what =
            "version " + status.version + ", up for " + age(status.uptime) + ", process " + std::to_string(status.pid);
        if (canonical(status.root) != canonical(question.root)) {
            report.fail("daemon", what + ": it serves another root, '" + status.root + "'");
        } else if (status.version != question.toolVersion) {
            report.warn("daemon", what + "; this tool is version " + question.toolVersion);
        } else {
            report.ok("daemon", what);
        }
        return true;
    } catch (Wire::Failure const &failure) {
        bool const refused = failure.code() == Wire::ErrorCode::NotPermitted;
        report.fail(refused ? "peer rights" : "daemon", failure.sentence());
        return false;
    }
}

void add(StorageContainerInfo const &container, Served &served) {
    served.containers.insert(container.id);
    served.containersByUrl[container.providerUrl].insert(container.id);
    for (int32_t i = 0; i < container.arrayCount; ++i) {
        served.arraysByUrl[container.providerUrl].insert(container.arrays[i]->arrayId);
    }
}

/// The session with the daemon is the process's; it takes its settings from the environment.
std::optional<Served> askWhatIsServed(Report &report) {
    StorageContainerResult *result = nullptr;
    std::string problem;
    if (LumoLib_Init(0, 0)) {
        LumoErrorEx const outcome = LumoLib_GetStorageContainer(0, nullptr, &result);
        problem = LumoLib_ErrorExIsSuccess(&outcome) ? "" : LumoLib_ErrorExStr(&outcome);
        LumoLib_Exit();
    } else {
        problem = "no session with the daemon can be opened";
    }
    if (!problem.empty()) {
        report.fail("containers", problem);
        return std::nullopt;
    }
    Containers const containers(result, &LumoLib_FreeStorageContainerResult);
    Served served;
    for (uint32_t i = 0; containers != nullptr && i < containers->containerCount; ++i) {
        add(*containers->containers[i], served);
    }
    return served;
}

} // namespace

std::optional<Served> checkDaemon(DaemonQuestion const &question, Report &report) {
    Wire::Paths const paths(question.root);
    bool const reachable = checkSocket("socket", paths.orderedSocket(), report);
    checkSocket("priority socket", paths.prioritySocket(), report);
    if (!reachable) {
        return std::nullopt;
    }
    if (question.offline) {
        report.warn("daemon", "not asked: TOVI_OFFLINE is set");
        return std::nullopt;
    }
    auto const deadline = Clock::now() + question.timeout;
    std::optional<Served> served;
    if (checkAnswer(question, report)) {
        if (!question.isOwnProcess) {
            served = askWhatIsServed(report); // the session is also others'
        } else {
            auto const left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
            setenv("TOVI_TIMEOUT_MS", std::to_string(std::max<int64_t>(left.count(), 1)).c_str(), 1);
            served = askWhatIsServed(report);
        }
    }
    LumoPlatform_ClearLastFailure(); // what failed stands in the rows
    return served;
}

} // namespace Tovicli::Cli
