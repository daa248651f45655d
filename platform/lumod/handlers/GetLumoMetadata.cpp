// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

namespace {

/// What a pair takes besides its texts, about.
constexpr std::size_t pairBytes = 40;

} // namespace

Answer<ReplyPtr> getLumoMetadata(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    auto metadata = core.volumes.askAbout<Orka::Metadata>(
        call, VolumeName::of(request.getGetLumoMetadata()),
        [containerId = canonicalContainerId(request.getGetLumoMetadata().getContainerId())](
            ProviderCalls const &calls, std::string const &uuid) { return calls.getMetadata(containerId, uuid); });
    return andThen(std::move(metadata), [](Orka::Metadata found) {
        auto const pairs = std::make_shared<Orka::Metadata const>(std::move(found));
        return listReply(
            pairs->size(),
            [pairs](std::size_t at) { return pairBytes + (*pairs)[at].key.size() + (*pairs)[at].value.size(); },
            [](Wire::Reply::Builder reply, unsigned size) { return reply.initMetadata(size); },
            [pairs](auto &list, unsigned place, std::size_t at) {
                list[place].setKey((*pairs)[at].key.c_str());
                list[place].setValue((*pairs)[at].value.c_str());
            });
    });
}

} // namespace Lumod
