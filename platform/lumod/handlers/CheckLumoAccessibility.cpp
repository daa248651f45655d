// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <algorithm>
#include <unordered_set>

#include <fmt/format.h>

#include "Endpoints.h"
#include "JoinAll.h"
#include "wire/Limits.h"

namespace Lumod {

namespace {

/// As they travel: one byte for each id.
enum class Accessibility : uint8_t { NonExistent = 0, Unconfirmed = 1, Inaccessible = 2, Accessible = 3 };

using Ids = std::vector<std::string>;
using Levels = std::vector<uint8_t>;
using Presences = std::vector<Orka::VolumePresence>;

Levels allOf(std::size_t count, Accessibility level) {
    return Levels(count, static_cast<uint8_t>(level));
}

/// What is said about volumes of a container that nobody exports now.
Accessibility levelWithoutContainer(Core const &core, Survey const &survey, std::string const &containerId) {
    bool const isKnown = survey.view->container(containerId) != nullptr;
    bool const allWereAsked = survey.isComplete() && !core.providers.all().empty();
    return !isKnown && allWereAsked ? Accessibility::NonExistent : Accessibility::Unconfirmed;
}

/// One provider's answer about all ids.
class Judge {
public:
    Judge(Core const &core, Survey const &survey, ServedContainer const &container, ProviderPtr const &provider)
        : isUnknown_(provider->injected == ProviderStatus::Unknown) {
        for (std::string_view const uid : usableEndpoints(*survey.view, container, provider, core.outages)) {
            usable_.insert(uid);
        }
    }

    Accessibility levelOf(Orka::VolumePresence const &presence) const {
        if (isUnknown_) {
            return Accessibility::Unconfirmed;
        }
        if (!presence.exists) {
            return Accessibility::NonExistent;
        }
        bool const isReachable = presence.boundTo ? usable_.count(*presence.boundTo) != 0 : !usable_.empty();
        return isReachable ? Accessibility::Accessible : Accessibility::Inaccessible;
    }

private:
    bool isUnknown_; ///< whether the provider can be trusted
    std::unordered_set<std::string_view> usable_;
};

/// The providers of one container and what they said.
struct Inquiry {
    Survey survey;
    std::vector<ProviderPtr> providers;
    std::size_t count;
};

bool isAnswer(Outcome<Presences> const &outcome, std::size_t count) {
    return outcome.ok() && outcome.value().size() == count;
}

Levels judge(Core const &core, Inquiry const &inquiry, ServedContainer const &container,
             kj::ArrayPtr<Outcome<Presences>> answers) {
    // An array that nobody could be asked about may know the ids that the others do not.
    bool allAnswered = container.unserved.empty();
    for (Outcome<Presences> const &answer : answers) {
        bool const knowsNothing = !answer.ok() && answer.failure().code() == Wire::ErrorCode::NoSuchContainer;
        allAnswered = allAnswered && (knowsNothing || isAnswer(answer, inquiry.count));
    }
    Levels levels = allOf(inquiry.count, allAnswered ? Accessibility::NonExistent : Accessibility::Unconfirmed);
    for (std::size_t index = 0; index < inquiry.providers.size(); ++index) {
        if (!isAnswer(answers[index], inquiry.count)) {
            continue;
        }
        Judge const judge(core, inquiry.survey, container, inquiry.providers[index]);
        Presences const &presences = answers[index].value();
        for (std::size_t at = 0; at < inquiry.count; ++at) {
            levels[at] = std::max(levels[at], static_cast<uint8_t>(judge.levelOf(presences[at])));
        }
    }
    return levels;
}

Answer<Levels> check(Core &core, CallPtr const &call, Survey survey, std::string const &containerId, Ids const &ids) {
    ServedContainer const *const container = survey.view->container(containerId);
    if (container == nullptr || !container->isExported()) {
        return Outcome<Levels>(allOf(ids.size(), levelWithoutContainer(core, survey, containerId)));
    }
    Inquiry inquiry{survey, survey.view->providersOf(*container), ids.size()};
    auto answers = kj::heapArrayBuilder<Answer<Presences>>(inquiry.providers.size());
    for (ProviderPtr const &provider : inquiry.providers) {
        answers.add(ProviderCalls(core.services, provider, call).queryVirtualVolumesById(containerId, ids));
    }
    return joinAll(answers.finish())
        .then([&core, inquiry = std::move(inquiry), container](kj::Array<Outcome<Presences>> &&outcomes) {
            return Outcome<Levels>(judge(core, inquiry, *container, outcomes));
        });
}

} // namespace

Answer<ReplyPtr> checkLumoAccessibility(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::CheckLumoAccessibility::Reader const wanted = request.getCheckLumoAccessibility();
    std::string containerId = canonicalContainerId(wanted.getContainerId());
    auto const list = wanted.getLumoIds();
    if (list.size() > Wire::lumoIdsPerRequest) {
        throw Wire::Failure(
            Wire::ErrorCode::InvalidArgument,
            fmt::format("{} ids are more than the {} that one request may name", list.size(), Wire::lumoIdsPerRequest));
    }
    Ids ids;
    ids.reserve(list.size());
    for (capnp::Text::Reader const id : list) {
        ids.push_back(canonicalUuid(textOf(id)));
    }
    auto levels = andThen(core.surveyor.survey(call),
                          [&core, call, containerId = std::move(containerId), ids = std::move(ids)](Survey survey) {
                              return check(core, call, std::move(survey), containerId, ids);
                          });
    return andThen(std::move(levels), [](Levels found) {
        return singleReply([found = std::move(found)](Wire::Reply::Builder reply) {
            reply.setAccessibility(kj::arrayPtr(found.data(), found.size()));
        });
    });
}

} // namespace Lumod
