// SPDX-License-Identifier: Apache-2.0
#include "Volumes.h"

#include <utility>

#include <fmt/format.h>

#include "Escape.h"
#include "wire/ContainerId.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

constexpr std::size_t directoryNameBytesMax = 255;
constexpr std::string_view allocationKey = "alloctype=";
constexpr std::string_view allocationClause = "alloctype=thin";

} // namespace

std::string textOf(capnp::Text::Reader text) {
    return std::string(text.begin(), text.size());
}

std::string canonicalContainerId(capnp::Text::Reader text) {
    auto const canonical = Wire::normalizeContainerId({text.begin(), text.size()});
    if (!canonical) {
        throw Failure(ErrorCode::InvalidArgument, fmt::format("'{}' is no container id", escaped(textOf(text))));
    }
    return *canonical;
}

std::string canonicalUuid(std::string uuid) {
    // A volume's id is a UUID, spelled like a container's.
    auto canonical = Wire::normalizeContainerId(uuid);
    return canonical ? *std::move(canonical) : uuid;
}

void requireDirectoryName(std::string const &name) {
    auto const refuse = [&name](char const *why) {
        throw Failure(ErrorCode::InvalidArgument,
                      fmt::format("'{}' cannot be a directory's name: {}", escaped(name), why));
    };
    if (name.empty()) {
        throw Failure(ErrorCode::InvalidArgument, "a directory's name cannot be empty");
    }
    if (name == "." || name == "..") {
        refuse("it means a directory already");
    }
    if (name.size() > directoryNameBytesMax) {
        refuse("it is longer than 255 bytes");
    }
    if (name.find('/') != std::string::npos) {
        refuse("it holds a slash");
    }
    if (hasControlCharacter(name)) {
        refuse("it holds a control character");
    }
    if (!isUtf8(name)) {
        refuse("it is not valid UTF-8");
    }
}

std::optional<std::string> profileOf(std::string const &policy, bool modify) {
    if (policy.empty()) {
        return std::nullopt;
    }
    if (!modify || policy.find(allocationKey) != std::string::npos) {
        return policy;
    }
    return fmt::format("{}{}{}", policy, policy.back() == ';' ? "" : ";", allocationClause);
}

VolumeName VolumeName::of(Wire::VolumeKey::Reader key) {
    VolumeName name{canonicalContainerId(key.getContainerId()), canonicalUuid(textOf(key.getUuid())), {}};
    if (name.uuid.empty()) {
        name.directoryName = textOf(key.getDirectoryName());
        requireDirectoryName(name.directoryName);
    }
    return name;
}

Answer<FoundVolume> Volumes::find(CallPtr const &call, VolumeName const &name) {
    return andThen(surveyor_.survey(call), [this, call, name](Survey survey) { return findIn(call, survey, name); });
}

Answer<FoundVolume> Volumes::findIn(CallPtr const &call, Survey const &survey, VolumeName const &name) {
    Question<FoundVolume> question;
    if (name.uuid.empty()) {
        question = [survey, name](ProviderCalls const &calls) {
            return andThen(calls.queryVirtualVolumeByDirectoryName(name.containerId, name.directoryName),
                           [survey, name, provider = calls.provider()](std::optional<Orka::VirtualVolume> volume) {
                               if (!volume) {
                                   throw Failure(ErrorCode::NoSuchVolume,
                                                 fmt::format("the storage container {} has no config volume '{}'",
                                                             name.containerId, name.directoryName));
                               }
                               return FoundVolume{*std::move(volume), provider, survey};
                           });
        };
    } else {
        question = [survey, name](ProviderCalls const &calls) {
            return andThen(calls.queryVirtualVolume(name.containerId, name.uuid),
                           [survey, provider = calls.provider()](Orka::VirtualVolume volume) {
                               return FoundVolume{std::move(volume), provider, survey};
                           });
        };
    }
    std::vector<ProviderPtr> providers = survey.view->providersOf(survey.container(name.containerId));
    return firstAnswer<FoundVolume>(call, std::move(providers), 0, name, std::move(question));
}

} // namespace Lumod
