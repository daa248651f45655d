// SPDX-License-Identifier: Apache-2.0
#include "ContainerCheck.h"

#include <algorithm>

#include "wire/Failure.h"

namespace Kestrel {
namespace {

/// Who mounts fewer than these would only wait for an answer that may have a hundred thousand containers in it.
constexpr int singlyMax = 16;
/// For how many mounts one answer counts, so that it does not grow old, nor large.
constexpr std::size_t toldMax = 1000;

} // namespace

ContainerCheck::ContainerCheck(LumoClient::Client &client)
    : client_(client) {}

void ContainerCheck::require(std::string const &containerId, std::vector<std::string> const &arrayIds) {
    if (isAnswered(containerId, arrayIds)) {
        return;
    }
    if (singly_ == singlyMax) {
        singly_ = 0;
        askForMany(containerId);
        if (isAnswered(containerId, arrayIds)) {
            return;
        }
    }
    ++singly_;
    client_.findStorageContainer(containerId, arrayIds);
}

bool ContainerCheck::isAnswered(std::string const &containerId, std::vector<std::string> const &arrayIds) {
    auto const found = told_.find(containerId);
    if (found == told_.end()) {
        return false;
    }
    std::vector<std::string> const holders = std::move(found->second);
    told_.erase(found);
    return std::all_of(arrayIds.begin(), arrayIds.end(), [&](std::string const &arrayId) {
        return std::find(holders.begin(), holders.end(), arrayId) != holders.end();
    });
}

void ContainerCheck::askForMany(std::string const &first) {
    told_.clear();
    try {
        client_.visitStorageContainers([&](std::string_view id, std::vector<std::string> const &arrayIds) {
            if (told_.size() < toldMax && (!told_.empty() || id == first)) {
                told_.emplace(id, arrayIds);
            }
        });
    } catch (Wire::Failure const &) {
        // The question about the one container tells what is wrong, if it matters for that one.
        told_.clear();
    }
}

} // namespace Kestrel
