// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Async.h"
#include "Call.h"
#include "ProviderCalls.h"
#include "Surveyor.h"
#include "wire/lumod.capnp.h"

namespace Lumod {

/// How a request names a volume: by uuid, or by directory name when the uuid is empty.
struct VolumeName {
    std::string containerId;
    std::string uuid;
    std::string directoryName;

    /// @throws Wire::Failure InvalidArgument for a container id that is none, or a volume without any name
    static VolumeName of(Wire::VolumeKey::Reader key);
};

/// A text that a request brought.
std::string textOf(capnp::Text::Reader text);
/// @throws Wire::Failure InvalidArgument
std::string canonicalContainerId(capnp::Text::Reader text);
/// Other spellings of a uuid become canonical; what is no uuid stays, and no array knows it.
std::string canonicalUuid(std::string uuid);
/// One path component: no slash, not "." or "..", no control characters, valid UTF-8, 1 to 255 bytes.
/// @throws Wire::Failure InvalidArgument
void requireDirectoryName(std::string const &name);
/// The profile that a volume is made with. The space-efficiency layer adds how to allocate, unless the policy says it.
std::optional<std::string> profileOf(std::string const &policy, bool modify);

/// A volume and where it was found.
struct FoundVolume {
    Orka::VirtualVolume volume;
    ProviderPtr provider;
    Survey survey; ///< holds the container
};

/// Finding volumes: by asking the providers of their container, one after the other, until one knows them.
class Volumes {
public:
    Volumes(Services &services, Surveyor &surveyor)
        : services_(services)
        , surveyor_(surveyor) {}

    /// Failures: of Survey::container, NoSuchVolume, the provider's.
    Answer<FoundVolume> find(CallPtr const &call, VolumeName const &name);

    /// Asks about a volume that is named by uuid or directory name.
    /// @param ask (ProviderCalls, uuid) -> Answer<T>
    template <typename T>
    Answer<T> askAbout(CallPtr const &call, VolumeName const &name,
                       std::function<Answer<T>(ProviderCalls const &, std::string const &uuid)> ask);

private:
    template <typename T>
    using Question = std::function<Answer<T>(ProviderCalls const &)>;

    /// The first answer of a provider that knows the volume.
    template <typename T>
    Answer<T> firstAnswer(CallPtr const &call, std::vector<ProviderPtr> providers, std::size_t at, VolumeName name,
                          Question<T> question) const;
    Answer<FoundVolume> findIn(CallPtr const &call, Survey const &survey, VolumeName const &name);

    Services &services_;
    Surveyor &surveyor_;
};

template <typename T>
Answer<T> Volumes::askAbout(CallPtr const &call, VolumeName const &name,
                            std::function<Answer<T>(ProviderCalls const &, std::string const &uuid)> ask) {
    if (name.uuid.empty()) {
        return andThen(find(call, name), [this, call, ask = std::move(ask)](FoundVolume found) {
            return ask(ProviderCalls(services_, found.provider, call), found.volume.uuid);
        });
    }
    return andThen(surveyor_.survey(call), [this, call, name, ask = std::move(ask)](Survey survey) -> Answer<T> {
        std::vector<ProviderPtr> providers = survey.view->providersOf(survey.container(name.containerId));
        return firstAnswer<T>(call, std::move(providers), 0, name,
                              [ask, uuid = name.uuid](ProviderCalls const &calls) { return ask(calls, uuid); });
    });
}

template <typename T>
Answer<T> Volumes::firstAnswer(CallPtr const &call, std::vector<ProviderPtr> providers, std::size_t at, VolumeName name,
                               Question<T> question) const {
    ProviderCalls const calls(services_, providers[at], call);
    Answer<T> answer = question(calls);
    return whateverCame(
        std::move(answer),
        [this, call, providers = std::move(providers), at, name = std::move(name),
         question = std::move(question)](Outcome<T> outcome) mutable -> Answer<T> {
            bool const isUnknown = !outcome.ok() && (outcome.failure().code() == Wire::ErrorCode::NoSuchVolume ||
                                                     outcome.failure().code() == Wire::ErrorCode::NoSuchContainer);
            if (!isUnknown || at + 1 == providers.size()) {
                return Answer<T>(std::move(outcome));
            }
            return firstAnswer<T>(call, std::move(providers), at + 1, std::move(name), std::move(question));
        });
}

} // namespace Lumod
