// SPDX-License-Identifier: Apache-2.0
#include "Run.h"

#include <csignal>
#include <ostream>

#include <sys/random.h>

#include <fmt/format.h>
#include <kj/async-io.h>
#include <kj/async-unix.h>

#include "Reports.h"
#include "orka/ProviderFactory.h"
#include "orka/conformance/Bugs.h"
#include "orka/conformance/Kit.h"
#include "orka/conformance/Printable.h"
#include "orka/conformance/Victim.h"

namespace OrkaConformance {

using namespace Orka::Conformance;

namespace {

/// A run's names and keys are nobody else's: an array remembers keys from one run to the next.
std::string freshRunId() {
    uint64_t number = 0;
    if (getrandom(&number, sizeof number, 0) != static_cast<ssize_t>(sizeof number)) {
        throw Wire::Failure(Wire::ErrorCode::IoError, "the system gives no random numbers");
    }
    return fmt::format("{:016x}", number);
}

std::unique_ptr<Orka::Provider> connected(std::string const &url, std::string const &bug, kj::Timer &timer,
                                          kj::Network &network, std::string const &certificates) {
    auto provider = Orka::makeProvider(url, {timer, nullptr, &network, certificates});
    return bug.empty() ? std::move(provider) : makeBuggy(bug, std::move(provider), timer);
}

/// The program itself, and what runVictim() takes apart again.
std::vector<std::string> victimWords(Options const &options) {
    return {"/proc/self/exe", "--victim", options.url, options.bug, options.certificates};
}

/// A mistake in the words is told before anything is asked.
void checkWords(Options const &options, std::function<std::unique_ptr<Orka::Provider>()> const &connect) {
    try {
        connect();
    } catch (Wire::Failure const &failure) {
        throw UsageError(failure.sentence());
    }
    for (auto const &pattern : options.only) {
        Options one;
        one.only = {pattern};
        bool matches = false;
        for (auto const &title : caseTitles()) {
            matches = matches || isChosen(one, title.name);
        }
        if (!matches) {
            throw UsageError("no case is named '" + pattern + "'; --list tells them all");
        }
    }
}

void write(std::ostream &out, Options const &options, Report const &report) {
    RunFacts const facts{options.url, options.seed};
    switch (options.format) {
    case Format::Json:
        out << jsonReport(facts, report);
        break;
    case Format::Junit:
        out << junitReport(facts, report);
        break;
    case Format::Text:
    case Format::Markdown:
        out << textSummary(report);
        break;
    }
}

ExitStatus statusOf(Report const &report) {
    if (report.interrupted) {
        return ExitStatus::Interrupted;
    }
    return report.count(Verdict::Failed) > 0 || !report.leftBehind.empty() ? ExitStatus::SomeFailed
                                                                           : ExitStatus::AllPassed;
}

ExitStatus runAll(Options const &options, kj::AsyncIoContext &io, std::ostream &out, std::ostream &err) {
    auto &timer = io.provider->getTimer();
    auto const connect = [&] {
        return connected(options.url, options.bug, timer, io.provider->getNetwork(), options.certificates);
    };
    checkWords(options, connect);
    auto signalled =
        io.unixEventPort.onSignal(SIGINT).exclusiveJoin(io.unixEventPort.onSignal(SIGTERM)).ignoreResult().fork();
    Kit kit({io.waitScope, timer, connect, freshRunId(), options.seed, options.timeoutMs * kj::MILLISECONDS,
             [&signalled] { return signalled.addBranch(); }, victimWords(options)});
    if (auto const failure = kit.reach()) {
        err << "orka-conformance: the provider cannot be reached: " << printable(failure->sentence()) << '\n';
        return ExitStatus::NotReachable;
    }
    auto const report = kit.run([&](std::string const &name) { return isChosen(options, name); },
                                [&](CaseResult const &result) {
                                    if (options.format == Format::Text) {
                                        out << textOf(result) << std::flush;
                                    }
                                });
    write(out, options, report);
    return statusOf(report);
}

} // namespace

ExitStatus run(Options const &options, std::ostream &out, std::ostream &err) {
    kj::UnixEventPort::captureSignal(SIGINT);
    kj::UnixEventPort::captureSignal(SIGTERM);
    auto io = kj::setupAsyncIo();
    return runAll(options, io, out, err);
}

int runVictim(std::vector<std::string> const &words) {
    if (words.size() < 3) {
        return static_cast<int>(ExitStatus::Usage);
    }
    return actAsVictim({words.begin() + 3, words.end()}, [&](kj::Timer &timer, kj::Network &network) {
        return connected(words[0], words[1], timer, network, words[2]);
    });
}

} // namespace OrkaConformance
