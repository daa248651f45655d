// SPDX-License-Identifier: Apache-2.0
#include "ProviderSet.h"

#include <algorithm>
#include <tuple>
#include <unordered_map>
#include <utility>

#include <fmt/format.h>

namespace Lumod {

ProviderPtr ProviderSet::make(Store::Provider const &record) const {
    auto entry = std::make_shared<ProviderEntry>();
    entry->record = record;
    try {
        entry->provider = factory_(record.url);
    } catch (Wire::Failure const &failure) {
        entry->unusable = failure;
    }
    return entry;
}

void ProviderSet::apply(std::vector<Store::Provider> const &records) {
    bool const same =
        std::equal(entries_.begin(), entries_.end(), records.begin(), records.end(),
                   [](ProviderPtr const &entry, Store::Provider const &record) { return entry->record == record; });
    if (same) {
        return; // the store changes with every mount, and all that is known of the providers' containers stays good
    }
    std::unordered_map<std::string_view, ProviderPtr> known;
    for (ProviderPtr const &entry : entries_) {
        known.emplace(entry->record.name, entry);
    }
    std::vector<ProviderPtr> next;
    next.reserve(records.size());
    for (Store::Provider const &record : records) {
        auto const old = known.find(record.name);
        if (old == known.end() || old->second->record.url != record.url) {
            next.push_back(make(record));
            continue;
        }
        ProviderEntry &entry = *old->second;
        if (entry.record.arrays != record.arrays) {
            entry.activations.clear();
            entry.record.arrays = record.arrays;
        }
        entry.record.auxText = record.auxText;
        next.push_back(old->second);
    }
    known.clear();
    entries_ = std::move(next);
    for (auto activation = activated_.begin(); activation != activated_.end();) {
        auto const stands = [&activation](ProviderPtr const &entry) {
            auto const flag = entry->activations.find(activation->first);
            return entry->record.name == activation->second && flag != entry->activations.end() && flag->second;
        };
        bool const keep = std::any_of(entries_.begin(), entries_.end(), stands);
        activation = keep ? std::next(activation) : activated_.erase(activation);
    }
    ++revision_;
}

ProviderPtr ProviderSet::named(std::string_view name) const {
    for (ProviderPtr const &entry : entries_) {
        if (entry->record.name == name) {
            return entry;
        }
    }
    throw Wire::Failure(Wire::ErrorCode::NoSuchProvider,
                        fmt::format("no provider is registered under the name '{}'", name));
}

ProviderPtr ProviderSet::serving(std::string const &arrayId, std::vector<ProviderPtr> const &exporters) const {
    auto const preferred = activated_.find(arrayId);
    // Greater is better: activated by a command, the priority; then the name that sorts first.
    auto const rank = [&](ProviderPtr const &entry) {
        bool const activated = preferred != activated_.end() && preferred->second == entry->record.name;
        return std::make_tuple(activated, entry->priorityFor(arrayId));
    };
    ProviderPtr best;
    for (ProviderPtr const &entry : exporters) {
        if (entry->isOffline() || !entry->isActiveFor(arrayId)) {
            continue;
        }
        if (!best || rank(entry) > rank(best) ||
            (rank(entry) == rank(best) && entry->record.name < best->record.name)) {
            best = entry;
        }
    }
    return best;
}

void ProviderSet::activate(ProviderEntry &provider, std::string const &arrayId) {
    provider.activations[arrayId] = true;
    activated_[arrayId] = provider.record.name;
    ++revision_;
}

void ProviderSet::deactivate(ProviderEntry &provider, std::string const &arrayId) {
    provider.activations[arrayId] = false;
    auto const activation = activated_.find(arrayId);
    if (activation != activated_.end() && activation->second == provider.record.name) {
        activated_.erase(activation);
    }
    ++revision_;
}

void ProviderSet::inject(ProviderEntry &provider, Injection const &injection) {
    provider.injected = injection.status;
    if (!injection.status && injection.flags.empty()) {
        provider.injectedFlags.clear();
    }
    for (auto const &[arrayId, isActive] : injection.flags) {
        provider.injectedFlags[arrayId] = isActive;
    }
    ++revision_;
}

} // namespace Lumod
