// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <charconv>
#include <csignal>
#include <memory>
#include <ostream>

#include <fmt/format.h>
#include <kj/async-unix.h>
#include <sys/resource.h>
#include <unistd.h>

#include "Commands.h"
#include "Words.h"
#include "orka/ArrayFile.h"
#include "orka/Embedded.h"
#include "orka/Service.h"
#include "orka/SystemReason.h"
#include "orka/conformance/Bugs.h"
#include "serve/Certificate.h"
#include "serve/Misbehaviour.h"
#include "serve/Server.h"
#include "wire/Failure.h"

namespace Orkasim {

namespace {

constexpr char const *defaultListen = "127.0.0.1:0";
constexpr char const *servedPath = "/orka";
constexpr int64_t longestMs = 3600000;

struct Options {
    std::string array;
    std::string host;   ///< as it stands in the URL
    std::string listen; ///< host:port
    std::string certificate;
    std::string key;
    std::string readyFile;
    std::string bug; ///< empty: none
    CertificateSpec certificateSpec;
    MisbehaviourSpec misbehaviour;
};

/// The host of ADDRESS:PORT, as it will stand in the URL.
std::string hostOf(std::string const &listen) {
    auto const colon = listen.rfind(':');
    auto const host = listen.substr(0, colon);
    bool const isHost =
        host.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._:[]") ==
        std::string::npos;
    auto const port = colon == std::string::npos ? "" : listen.substr(colon + 1);
    uint16_t number = 0;
    auto const *const end = port.data() + port.size();
    auto const read = std::from_chars(port.data(), end, number);
    bool const isPort = read.ec == std::errc() && read.ptr == end;
    // The library takes these two names for sockets of this machine.
    if (host.empty() || !isHost || !isPort || host == "unix" || host == "unix-abstract") {
        throw UsageError("--listen is ADDRESS:PORT, not '" + listen + "'");
    }
    return host;
}

std::string checkedBug(std::string name) {
    auto const &bugs = Orka::Conformance::bugs();
    auto const isIt = [&](Orka::Conformance::Bug const &bug) { return bug.name == name; };
    if (!name.empty() && std::none_of(bugs.begin(), bugs.end(), isIt)) {
        throw UsageError("there is no bug '" + name + "'; 'orkasim serve --bug help' lists them all");
    }
    return name;
}

/// Whether the words ask what bugs there are, in place of an array to serve.
bool asksForBugs(Words const &words) {
    return words == Words{"--bug", "help"} || words == Words{"--bug=help"};
}

void listBugs(std::ostream &out) {
    for (auto const &bug : Orka::Conformance::bugs()) {
        out << bug.name << "\n    " << bug.description << "\n    "
            << (bug.hiddenOverHttps != nullptr ? std::string("hidden here: ") + bug.hiddenOverHttps
                                               : std::string("found by ") + bug.caughtBy)
            << '\n';
    }
}

Options optionsOf(Words const &words) {
    SortedWords const sorted(words, {"--expired-cert"},
                             {"--listen", "--cert", "--key", "--ready-file", "--cert-name", "--latency", "--error-rate",
                              "--seed", "--misbehave", "--on", "--times", "--bug"});
    Options options;
    options.array = sorted.named({"ARRAYFILE"})[0];
    options.listen = sorted.value("--listen").value_or(defaultListen);
    options.host = hostOf(options.listen);
    options.certificate = sorted.value("--cert").value_or("");
    options.key = sorted.value("--key").value_or("");
    if (options.certificate.empty() != options.key.empty()) {
        throw UsageError("--cert and --key go together");
    }
    options.readyFile = sorted.value("--ready-file").value_or("");
    auto name = options.host;
    if (name.front() == '[' && name.back() == ']') {
        name = name.substr(1, name.size() - 2);
    }
    options.certificateSpec.names = {sorted.value("--cert-name").value_or(name)};
    if (sorted.has("--expired-cert")) {
        options.certificateSpec.validFrom = std::chrono::hours(-48);
        options.certificateSpec.validUntil = std::chrono::hours(-24);
    }
    options.bug = checkedBug(sorted.value("--bug").value_or(""));
    auto &misbehaviour = options.misbehaviour;
    misbehaviour.latency = sorted.number("--latency", 0, longestMs).value_or(0) * kj::MILLISECONDS;
    misbehaviour.errorRate = sorted.number("--error-rate", 0, 100).value_or(0);
    misbehaviour.seed = static_cast<uint64_t>(sorted.number("--seed", 0, INT64_MAX).value_or(1));
    misbehaviour.operation = sorted.value("--on").value_or("");
    if (!misbehaviour.operation.empty() && !Orka::ProviderService::serves(misbehaviour.operation)) {
        throw UsageError("--on is an operation, such as getMetadata, not '" + misbehaviour.operation + "'");
    }
    misbehaviour.times = sorted.number("--times", 0, INT64_MAX);
    if (auto const misdeed = sorted.value("--misbehave")) {
        misbehaviour.misdeed = misdeedNamed(*misdeed);
        if (!misbehaviour.misdeed) {
            throw UsageError(
                fmt::format("--misbehave is one of {}, not '{}'", fmt::join(misdeedNames(), ", "), *misdeed));
        }
    } else if (!misbehaviour.operation.empty() || misbehaviour.times) {
        throw UsageError("--on and --times tell when to --misbehave");
    }
    return options;
}

/// The pair that was given; where its files are missing, a new one that is kept there.
Identity identityFor(Options const &options) {
    if (options.certificate.empty()) {
        return makeIdentity(options.certificateSpec);
    }
    if (::access(options.certificate.c_str(), F_OK) == 0 && ::access(options.key.c_str(), F_OK) == 0) {
        return readIdentity(options.certificate, options.key);
    }
    auto identity = makeIdentity(options.certificateSpec);
    writeIdentity(identity, options.certificate, options.key);
    return identity;
}

/// The array file as it is, or seen through the bug that was asked for.
std::unique_ptr<Orka::Provider> providerFor(Options const &options, kj::Timer &timer) {
    auto provider = std::make_unique<Orka::EmbeddedProvider>(options.array, Orka::ProviderSurroundings{timer, nullptr});
    return options.bug.empty() ? std::move(provider)
                               : Orka::Conformance::makeBuggy(options.bug, std::move(provider), timer);
}

/// Every client takes a descriptor.
void raiseDescriptorLimit() {
    rlimit limit{};
    if (::getrlimit(RLIMIT_NOFILE, &limit) == 0) {
        limit.rlim_cur = limit.rlim_max;
        ::setrlimit(RLIMIT_NOFILE, &limit);
    }
}

kj::Own<kj::ConnectionReceiver> listenAt(kj::AsyncIoContext &io, std::string const &address) {
    try {
        return io.provider->getNetwork().parseAddress(address.c_str()).wait(io.waitScope)->listen();
    } catch (kj::Exception const &exception) {
        throw Wire::Failure(Wire::ErrorCode::IoError,
                            fmt::format("cannot listen at {}: {}", address, Orka::systemReason(exception)));
    }
}

} // namespace

void serve(Words const &words, Console const &console) {
    if (asksForBugs(words)) {
        listBugs(console.out);
        return;
    }
    auto const options = optionsOf(words);
    // What is no array file is told now, not to the first client.
    Orka::ArrayFile(options.array).counts();
    auto const identity = identityFor(options);
    raiseDescriptorLimit();
    for (int const signal : {SIGTERM, SIGINT}) {
        kj::UnixEventPort::captureSignal(signal);
    }
    auto io = kj::setupAsyncIo();
    auto &timer = io.provider->getTimer();
    auto const provider = providerFor(options, timer);
    Orka::ProviderService service(*provider, timer, servedPath);
    Misbehaviour misbehaviour(service, timer, options.misbehaviour);
    auto port = listenAt(io, options.listen);
    auto const url = fmt::format("https://{}:{}{}", options.host, port->getPort(), servedPath);
    Server server(kj::mv(port), identity, misbehaviour, service, timer);
    auto serving = server.run();
    console.out << url << std::endl;
    if (!options.readyFile.empty()) {
        writeFile(options.readyFile, url + "\n", 0644);
    }
    auto ended = io.unixEventPort.onSignal(SIGTERM)
                     .exclusiveJoin(io.unixEventPort.onSignal(SIGINT))
                     .ignoreResult()
                     .exclusiveJoin(kj::mv(serving));
    ended.wait(io.waitScope);
    server.stop().wait(io.waitScope);
}

} // namespace Orkasim
