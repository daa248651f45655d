// SPDX-License-Identifier: Apache-2.0
//
// The daemon's program: reads its options, takes the root's lock, opens log and sockets, wires the parts together and
// runs them until a signal ends it.
#include <array>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <iostream>
#include <string>
#include <utility>

#include <fcntl.h>
#include <sys/random.h>
#include <sys/resource.h>
#include <unistd.h>

#include <fmt/format.h>
#include <kj/async-io.h>
#include <kj/async-unix.h>

#include "Options.h"
#include "lumod/Daemon.h"
#include "lumod/RunDirectory.h"
#include "lumod/Server.h"
#include "lumod/ServiceManager.h"
#include "orka/ProviderFactory.h"
#include "wire/Failure.h"
#include "wire/Paths.h"

namespace {

constexpr int exitFailure = 1;
constexpr int exitUsage = 2;
/// Events to run before the sockets are looked at again, so that busy clients cannot keep the others out. An event may
/// be a whole request.
constexpr unsigned eventsBetweenPolls = 32;

/// A daemon that was started with closed standard descriptors must not take a database file for its stderr.
void openStandardDescriptors() {
    for (int descriptor = ::open("/dev/null", O_RDWR); descriptor >= 0; descriptor = ::open("/dev/null", O_RDWR)) {
        if (descriptor > STDERR_FILENO) {
            ::close(descriptor);
            return;
        }
    }
}

/// Every client takes a descriptor; the usual soft limit is for programs that use select().
void raiseDescriptorLimit() {
    rlimit limit{};
    if (::getrlimit(RLIMIT_NOFILE, &limit) == 0) {
        limit.rlim_cur = limit.rlim_max;
        ::setrlimit(RLIMIT_NOFILE, &limit);
    }
}

std::string environmentText(char const *name) {
    char const *const value = std::getenv(name);
    return value == nullptr ? std::string() : std::string(value);
}

/// Keys that no daemon has used before: a random number of this process, and a count.
std::function<std::string()> idempotencyKeys() {
    std::array<uint64_t, 2> random{};
    if (::getrandom(random.data(), sizeof random, 0) != static_cast<ssize_t>(sizeof random)) {
        throw Wire::Failure(Wire::ErrorCode::InternalError, "the kernel gave no random bytes for idempotency keys");
    }
    return [prefix = fmt::format("{:016x}{:016x}", random[0], random[1]), count = uint64_t{0}]() mutable {
        return fmt::format("{}-{}", prefix, ++count);
    };
}

kj::Promise<void> reopenLogOnHangup(kj::UnixEventPort &port, Lumod::Log &log) {
    return port.onSignal(SIGHUP).then([&port, &log](siginfo_t &&) {
        log.reopen();
        log.write(Lumod::LogLevel::Info, "-", "reopened the log file");
        return reopenLogOnHangup(port, log);
    });
}

int run(Options const &options) {
    Wire::Paths const paths(options.root);
    Lumod::PassedSockets sockets = Lumod::takePassedSockets(paths);
    Lumod::RunDirectory runDirectory(paths, options.group);
    auto const sink = Lumod::openLogFile(paths.logFile());
    Lumod::Log log(*sink, options.logLevel);
    raiseDescriptorLimit();

    for (int const signal : {SIGTERM, SIGINT, SIGHUP}) {
        kj::UnixEventPort::captureSignal(signal);
    }
    auto io = kj::setupAsyncIo();
    io.waitScope.setBusyPollInterval(eventsBetweenPolls);
    kj::Timer &timer = io.provider->getTimer();

    Lumod::Settings settings;
    settings.root = paths.root();
    settings.version = TOVI_VERSION;
    settings.unbindPeriod = options.unbindPeriodUs * kj::MICROSECONDS;
    Orka::ProviderSurroundings const providers{timer, nullptr, &io.provider->getNetwork(), paths.certificates()};
    Lumod::Daemon daemon(std::move(settings),
                         {timer, log,
                          [&providers](std::string const &url) { return Orka::makeProvider(url, providers); },
                          idempotencyKeys()});
    Lumod::Server server(daemon, io, Lumod::Admission{::geteuid(), options.group});
    server.listen(sockets.ordered ? std::move(sockets.ordered) : runDirectory.bindOrderedSocket(), true);
    server.listen(sockets.priority ? std::move(sockets.priority) : runDirectory.bindPrioritySocket(), false);

    log.write(Lumod::LogLevel::Info, "-", fmt::format("lumod {} serves {}", TOVI_VERSION, paths.root()));
    std::cout << "lumod: ready at " << paths.orderedSocket() << std::endl;
    Lumod::notifyServiceManager("READY=1");

    auto const hangups = reopenLogOnHangup(io.unixEventPort, log).eagerlyEvaluate(nullptr);
    auto ended = io.unixEventPort.onSignal(SIGTERM).exclusiveJoin(io.unixEventPort.onSignal(SIGINT));
    siginfo_t const signal = ended.wait(io.waitScope);
    log.write(Lumod::LogLevel::Info, "-", fmt::format("Ending: signal {}", signal.si_signo));
    Lumod::notifyServiceManager("STOPPING=1");
    server.stop().wait(io.waitScope);
    log.write(Lumod::LogLevel::Info, "-", "Ended");
    return EXIT_SUCCESS;
}

} // namespace

int main(int count, char **arguments) {
    openStandardDescriptors();
    Options options;
    try {
        options = parseOptions(count, arguments, Wire::rootFromEnvironment(), environmentText("TOVI_LOG_LEVEL"));
    } catch (Wire::Failure const &failure) {
        std::cerr << "lumod: " << failure.sentence() << "\nTry lumod --help.\n";
        return exitUsage;
    }
    if (options.help || options.version) {
        std::cout << (options.help ? helpText() : fmt::format("lumod {}\n", TOVI_VERSION)) << std::flush;
        return std::cout ? EXIT_SUCCESS : exitFailure;
    }
    try {
        return run(options);
    } catch (Wire::Failure const &failure) {
        std::cerr << "lumod: " << failure.sentence() << "\n";
    } catch (kj::Exception const &exception) {
        std::cerr << "lumod: " << exception.getDescription().cStr() << "\n";
    } catch (std::exception const &exception) {
        std::cerr << "lumod: " << exception.what() << "\n";
    }
    return exitFailure;
}
