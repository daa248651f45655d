// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

namespace Lumod {

namespace {

using ConfigVolumes = std::vector<Orka::ConfigVolume>;

/// What an element takes besides its texts, about.
constexpr std::size_t elementBytes = 40;

/// Gathers the volumes of a container from its providers, one after the other, until there are enough.
Answer<ConfigVolumes> gather(Core &core, CallPtr const &call, std::vector<ProviderPtr> providers,
                             std::string containerId, int32_t max, ConfigVolumes found) {
    auto const missing = max - static_cast<int64_t>(found.size());
    if (providers.empty() || missing <= 0) {
        return Outcome<ConfigVolumes>(std::move(found));
    }
    ProviderCalls const calls(core.services, providers.front(), call);
    providers.erase(providers.begin());
    return andThen(calls.queryVirtualVolumesOfContainer(containerId, missing),
                   [&core, call, providers = std::move(providers), containerId, max,
                    found = std::move(found)](ConfigVolumes more) mutable {
                       found.insert(found.end(), std::make_move_iterator(more.begin()),
                                    std::make_move_iterator(more.end()));
                       return gather(core, call, std::move(providers), std::move(containerId), max, std::move(found));
                   });
}

ReplyPtr replyOf(ConfigVolumes volumes) {
    auto const shared = std::make_shared<ConfigVolumes const>(std::move(volumes));
    return listReply(
        shared->size(),
        [shared](std::size_t at) {
            return elementBytes + (*shared)[at].uuid.size() + (*shared)[at].directoryName.size();
        },
        [](Wire::Reply::Builder reply, unsigned size) { return reply.initConfigLumos(size); },
        [shared](auto &list, unsigned place, std::size_t at) {
            list[place].setUuid((*shared)[at].uuid.c_str());
            list[place].setDirectoryName((*shared)[at].directoryName.c_str());
        });
}

} // namespace

Answer<ReplyPtr> queryAllConfigLumos(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::QueryAllConfigLumos::Reader const query = request.getQueryAllConfigLumos();
    std::string containerId = canonicalContainerId(query.getContainerId());
    int32_t const max = query.getMax();
    if (max < 0) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            fmt::format("{} is no number of config volumes to ask for", max));
    }
    auto volumes =
        andThen(core.surveyor.survey(call), [&core, call, containerId = std::move(containerId), max](Survey survey) {
            std::vector<ProviderPtr> providers = survey.view->providersOf(survey.container(containerId));
            return gather(core, call, std::move(providers), containerId, max, {});
        });
    return andThen(std::move(volumes), [](ConfigVolumes found) { return replyOf(std::move(found)); });
}

} // namespace Lumod
