// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <kj/time.h>

#include "orka/Provider.h"
#include "store/HostStore.h"

namespace Lumod {

/// What a provider is made to look like; the README of this folder tells what each state does.
enum class ProviderStatus { Online, Offline, SyncError, Unknown };

std::optional<ProviderStatus> providerStatusNamed(std::string_view word);
char const *nameOf(ProviderStatus status);

/// One registered provider: the store's record, the way to reach it, and what was put over it in memory.
struct ProviderEntry {
    Store::Provider record;
    std::unique_ptr<Orka::Provider> provider;  ///< empty when the URL names none
    std::optional<Wire::Failure> unusable;     ///< why it is empty
    std::optional<ProviderStatus> injected;    ///< nothing: as it really is
    std::map<std::string, bool> injectedFlags; ///< array id: active
    std::map<std::string, bool> activations;   ///< array id: activated or deactivated
    std::optional<std::string> toldContext;    ///< the Orka context that it was told last
    std::optional<kj::TimePoint> contextTried; ///< when telling was last tried without success
    std::optional<kj::TimePoint> silentSince;  ///< it used up its time without an answer, and has given none since
    bool isBeingTried = false;                 ///< somebody finds out when a silent one answers again

    bool isOffline() const {
        return injected == ProviderStatus::Offline;
    }
    /// The record's entry of an array; null when the record lists arrays and this is none of them, or lists none.
    Store::ProviderArray const *listed(std::string_view arrayId) const;
    /// Whether the record lets it serve the array at all.
    bool mayServe(std::string_view arrayId) const {
        return record.arrays.empty() || listed(arrayId) != nullptr;
    }
    bool isActiveFor(std::string const &arrayId) const;
    int32_t priorityFor(std::string_view arrayId) const;
};

using ProviderPtr = std::shared_ptr<ProviderEntry>;

} // namespace Lumod
