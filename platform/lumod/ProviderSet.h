// SPDX-License-Identifier: Apache-2.0
//
// The registered providers, and which of them serves which array. What the store says is the ground; what commands put
// over it (activations, injected states and flags) lives here, in memory, and a restart forgets it.
//
// An array is served by the provider that a command activated for it last; without one by the active provider with the
// highest priority number, the name breaking a tie. A provider that is offline serves nothing.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "ProviderEntry.h"

namespace Lumod {

class ProviderSet {
public:
    using Factory = std::function<std::unique_ptr<Orka::Provider>(std::string const &url)>;

    explicit ProviderSet(Factory factory)
        : factory_(std::move(factory)) {}

    /// Takes over the store's records. A provider is kept, with what it remembers, while its URL stays the same; what
    /// was activated or deactivated counts until its record's arrays change.
    void apply(std::vector<Store::Provider> const &records);

    /// In the order of registration.
    std::vector<ProviderPtr> const &all() const {
        return entries_;
    }
    /// @throws Wire::Failure NoSuchProvider
    ProviderPtr named(std::string_view name) const;

    /// Changes whenever the answer to serving() may have.
    uint64_t revision() const {
        return revision_;
    }

    /// Who serves an array among providers that export it; empty when none is active.
    ProviderPtr serving(std::string const &arrayId, std::vector<ProviderPtr> const &exporters) const;

    void activate(ProviderEntry &provider, std::string const &arrayId);
    void deactivate(ProviderEntry &provider, std::string const &arrayId);

    struct Injection {
        std::optional<ProviderStatus> status; ///< nothing: takes the injected status back
        std::map<std::string, bool> flags;
    };
    /// Flags are added to those injected before; taking the status back without flags takes the flags back as well.
    void inject(ProviderEntry &provider, Injection const &injection);

    /// The provider that was activated last for each array.
    std::map<std::string, std::string> const &activated() const {
        return activated_;
    }

private:
    ProviderPtr make(Store::Provider const &record) const;

    Factory factory_;
    std::vector<ProviderPtr> entries_;
    std::map<std::string, std::string> activated_; ///< array id: provider name
    uint64_t revision_ = 0;
};

} // namespace Lumod
