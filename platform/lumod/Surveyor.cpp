// SPDX-License-Identifier: Apache-2.0
#include "Surveyor.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

#include "JoinAll.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

/// Lists of arrays and containers belong together when their versions agree; an array that changes all the time
/// does not keep us for ever.
constexpr int attemptsForAgreement = 3;
constexpr kj::Duration contextRetryPause = 60 * kj::SECONDS;
/// How long a silent provider gets to answer when it is tried, and what lies between two trials.
constexpr kj::Duration trialTime = 10 * kj::SECONDS;
constexpr kj::Duration trialPause = 1 * kj::SECONDS;

} // namespace

void Survey::requireAnAnswer() const {
    if (!failed.empty() && view->sources().empty()) {
        throw failed.front().reason;
    }
}

ServedContainer const &Survey::container(std::string const &containerId) const {
    ServedContainer const *const found = view->container(containerId);
    if (found != nullptr && found->isExported()) {
        return *found;
    }
    if (!failed.empty()) {
        throw failed.front().reason;
    }
    if (found != nullptr) {
        throw Failure(ErrorCode::NoActiveProvider,
                      fmt::format("no active provider serves the storage array {} of the storage container {}",
                                  view->arrays()[found->unserved.front()].facts->id, containerId));
    }
    if (!offline.empty()) {
        throw offline.front().reason;
    }
    throw Failure(ErrorCode::NoSuchContainer,
                  fmt::format("no registered provider exports a storage container {}", containerId));
}

CallPtr Surveyor::inquiryOf(CallPtr const &call, std::size_t providers) const {
    if (providers < 2) {
        return call;
    }
    Call inquiry = *call;
    inquiry.deadline -= (call->deadline - services_.timer.now()) / 2;
    return std::make_shared<Call const>(std::move(inquiry));
}

Answer<Survey> Surveyor::survey(CallPtr const &call) {
    return andThen(services_.host.current(call), [this, call](std::shared_ptr<HostSnapshot const>) -> Answer<Survey> {
        std::vector<ProviderPtr> asked;
        for (ProviderPtr const &provider : services_.providers.all()) {
            if (!provider->isOffline()) {
                asked.push_back(provider);
            }
        }
        auto answers = kj::heapArrayBuilder<Answer<Source>>(asked.size());
        CallPtr const inquiry = inquiryOf(call, asked.size());
        for (ProviderPtr const &provider : asked) {
            tellContext(provider, call);
            answers.add(asked.size() < 2 ? ask(provider, inquiry, attemptsForAgreement)
                                         : askAmongOthers(provider, inquiry));
        }
        return joinAll(answers.finish())
            .then([this, call, asked = std::move(asked)](kj::Array<Outcome<Source>> &&sources) {
                return Outcome<Survey>(assemble(asked, kj::mv(sources), call));
            });
    });
}

Answer<Source> Surveyor::ask(ProviderPtr const &provider, CallPtr const &call, int attemptsLeft) const {
    ProviderCalls const calls(services_, provider, call);
    return andThen(calls.queryStorageArray(), [this, calls, call,
                                               attemptsLeft](Orka::Listing<Orka::StorageArray> arrays) {
        return andThen(calls.queryStorageContainer(),
                       [this, calls, call, attemptsLeft, arrays = std::move(arrays)](
                           Orka::Listing<Orka::StorageContainer> containers) mutable -> Answer<Source> {
                           if (arrays.version != containers.version && attemptsLeft > 1) {
                               return ask(calls.provider(), call, attemptsLeft - 1);
                           }
                           return Outcome<Source>(Source{calls.provider(), std::move(arrays), std::move(containers)});
                       });
    });
}

Answer<Source> Surveyor::askAmongOthers(ProviderPtr const &provider, CallPtr const &inquiry) {
    if (provider->silentSince) {
        noteSilence(provider);
        auto const seconds = (services_.timer.now() - *provider->silentSince) / kj::SECONDS;
        return Outcome<Source>(
            Failure(ErrorCode::ProviderUnreachable,
                    fmt::format("the provider '{}' has been silent for {} s and is left out until it answers",
                                provider->record.name, seconds)));
    }
    return ask(provider, inquiry, attemptsForAgreement).then([this, provider, inquiry](Outcome<Source> &&outcome) {
        if (outcome.ok()) {
            provider->silentSince = std::nullopt;
        } else if (services_.timer.now() >= inquiry->deadline) {
            noteSilence(provider);
        }
        return std::move(outcome);
    });
}

void Surveyor::noteSilence(ProviderPtr const &provider) {
    if (!provider->silentSince) {
        provider->silentSince = services_.timer.now();
    }
    if (!provider->isBeingTried) {
        provider->isBeingTried = true;
        services_.tasks.add(
            tryUntilAnswered(provider).attach(kj::defer([provider] { provider->isBeingTried = false; })));
    }
}

kj::Promise<void> Surveyor::tryUntilAnswered(ProviderPtr provider) {
    auto const deadline = services_.timer.now() + trialTime;
    auto const trial = std::make_shared<Call const>(Call{"-", deadline, false});
    return ask(provider, trial, 1).then([this, provider, deadline](Outcome<Source> &&outcome) -> kj::Promise<void> {
        // A failure is an answer as well, unless it took all of the time.
        if (outcome.ok() || services_.timer.now() < deadline) {
            provider->silentSince = std::nullopt;
        }
        if (!provider->silentSince) {
            services_.log.write(LogLevel::Info, "-",
                                fmt::format("the provider '{}' answers again", provider->record.name));
            return kj::READY_NOW;
        }
        return services_.timer.afterDelay(trialPause).then([this, provider]() -> kj::Promise<void> {
            return isRegistered(provider) ? tryUntilAnswered(provider) : kj::READY_NOW;
        });
    });
}

bool Surveyor::isRegistered(ProviderPtr const &provider) const {
    auto const &all = services_.providers.all();
    return std::find(all.begin(), all.end(), provider) != all.end();
}

Survey Surveyor::assemble(std::vector<ProviderPtr> const &asked, kj::Array<Outcome<Source>> answers,
                          CallPtr const &call) {
    Survey survey;
    std::vector<Source> sources;
    for (std::size_t index = 0; index < asked.size(); ++index) {
        if (answers[index].ok()) {
            sources.push_back(std::move(answers[index]).value());
            continue;
        }
        Failure const &failure = answers[index].failure();
        services_.log.write(
            LogLevel::Warning, call->trace,
            fmt::format("left out the provider '{}': {}", asked[index]->record.name, failure.sentence()));
        survey.failed.push_back({asked[index], failure});
    }
    for (ProviderPtr const &provider : services_.providers.all()) {
        if (provider->isOffline()) {
            survey.offline.push_back(
                {provider, Failure(ErrorCode::ProviderOffline,
                                   fmt::format("the provider '{}' is offline (injected)", provider->record.name))});
        }
    }
    survey.view = viewOf(std::move(sources));
    return survey;
}

std::shared_ptr<View const> Surveyor::viewOf(std::vector<Source> sources) {
    Fingerprint fingerprint;
    for (Source const &source : sources) {
        fingerprint.emplace_back(source.provider.get(), source.arrays.version, source.containers.version);
    }
    if (!view_ || fingerprint != fingerprint_ || revision_ != services_.providers.revision()) {
        view_ = std::make_shared<View>(std::move(sources), services_.providers);
        fingerprint_ = std::move(fingerprint);
        revision_ = services_.providers.revision();
    }
    return view_;
}

void Surveyor::tellContext(ProviderPtr const &provider, CallPtr const &call) {
    std::optional<std::string> const context = services_.host.lastKnown()->orkaContext;
    bool const triedJustNow =
        provider->contextTried && services_.timer.now() - *provider->contextTried < contextRetryPause;
    if (provider->toldContext == context || triedJustNow || provider->unusable) {
        return;
    }
    provider->contextTried = services_.timer.now();
    // It goes with every request anyway, so nobody waits for this one.
    ProviderCalls const calls(services_, provider, call);
    services_.tasks.add(calls.setContext().then([this, provider, call, context](Outcome<Done> &&outcome) {
        if (outcome.ok()) {
            provider->toldContext = context;
            provider->contextTried = std::nullopt;
            return;
        }
        services_.log.write(LogLevel::Warning, call->trace,
                            fmt::format("the provider '{}' was not told the Orka context: {}", provider->record.name,
                                        outcome.failure().sentence()));
    }));
}

} // namespace Lumod
