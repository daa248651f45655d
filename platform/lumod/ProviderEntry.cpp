// SPDX-License-Identifier: Apache-2.0
#include "ProviderEntry.h"

#include <algorithm>
#include <array>
#include <utility>

namespace Lumod {

namespace {

constexpr std::array<std::pair<ProviderStatus, char const *>, 4> statuses{{{ProviderStatus::Online, "online"},
                                                                           {ProviderStatus::Offline, "offline"},
                                                                           {ProviderStatus::SyncError, "syncError"},
                                                                           {ProviderStatus::Unknown, "unknown"}}};

} // namespace

std::optional<ProviderStatus> providerStatusNamed(std::string_view word) {
    for (auto const &[status, name] : statuses) {
        if (word == name) {
            return status;
        }
    }
    return std::nullopt;
}

char const *nameOf(ProviderStatus status) {
    return statuses[static_cast<std::size_t>(status)].second;
}

Store::ProviderArray const *ProviderEntry::listed(std::string_view arrayId) const {
    auto const found = std::find_if(record.arrays.begin(), record.arrays.end(),
                                    [arrayId](Store::ProviderArray const &array) { return array.arrayId == arrayId; });
    return found == record.arrays.end() ? nullptr : &*found;
}

bool ProviderEntry::isActiveFor(std::string const &arrayId) const {
    if (!mayServe(arrayId)) {
        return false;
    }
    if (auto const flag = injectedFlags.find(arrayId); flag != injectedFlags.end()) {
        return flag->second;
    }
    if (auto const flag = activations.find(arrayId); flag != activations.end()) {
        return flag->second;
    }
    Store::ProviderArray const *const array = listed(arrayId);
    return array == nullptr || array->isActive;
}

int32_t ProviderEntry::priorityFor(std::string_view arrayId) const {
    Store::ProviderArray const *const array = listed(arrayId);
    return array == nullptr ? 0 : array->priority;
}

} // namespace Lumod
