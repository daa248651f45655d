// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <algorithm>

#include <fmt/format.h>

#include "StorageReply.h"

namespace Lumod {

namespace {

/// Every array that was asked for must hold the container.
void requireArrays(View const &view, ServedContainer const &container, std::vector<std::string> const &arrayIds) {
    for (std::string const &arrayId : arrayIds) {
        bool const holds = std::any_of(container.arrays.begin(), container.arrays.end(),
                                       [&](uint32_t place) { return view.arrays()[place].facts->id == arrayId; });
        if (!holds) {
            throw Wire::Failure(
                Wire::ErrorCode::NoSuchArray,
                fmt::format("the storage container {} is not on a storage array '{}'", container.facts->id, arrayId));
        }
    }
}

} // namespace

Answer<ReplyPtr> findStorageContainer(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::FindStorageContainer::Reader const wanted = request.getFindStorageContainer();
    std::string containerId = canonicalContainerId(wanted.getContainerId());
    std::vector<std::string> arrayIds;
    for (capnp::Text::Reader const arrayId : wanted.getArrayIds()) {
        arrayIds.push_back(textOf(arrayId));
    }
    return andThen(core.surveyor.survey(call),
                   [&core, containerId = std::move(containerId), arrayIds = std::move(arrayIds)](Survey survey) {
                       ServedContainer const &container = survey.container(containerId);
                       requireArrays(*survey.view, container, arrayIds);
                       auto const place = static_cast<uint32_t>(&container - survey.view->containers().data());
                       return storageReply(survey.view, {place}, core.outages.all());
                   });
}

} // namespace Lumod
