// SPDX-License-Identifier: Apache-2.0
//
// Everything that the providers export, put together: each array with the provider that serves it, each container with
// the arrays that serve it. A container appears through the arrays that its exporter serves; one that is on arrays of
// several providers gathers the arrays of all of them. Order: providers as they were registered, then the provider's.
#pragma once

#include <cstdint>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "ProviderSet.h"

namespace Lumod {

/// What one provider answered.
struct Source {
    ProviderPtr provider;
    Orka::Listing<Orka::StorageArray> arrays;
    Orka::Listing<Orka::StorageContainer> containers;
};

struct ServedArray {
    Orka::StorageArray const *facts; ///< as its provider tells them
    ProviderPtr provider;            ///< empty: no active provider serves it
};

struct ServedContainer {
    Orka::StorageContainer const *facts;
    ProviderPtr provider;           ///< of its first array, or the one that exports it
    std::vector<uint32_t> arrays;   ///< places in View::arrays, all of them served
    std::vector<uint32_t> unserved; ///< arrays that hold it without an active provider that says so

    /// A container whose arrays are all without an active provider is known but not exported.
    bool isExported() const {
        return !arrays.empty() || unserved.empty();
    }
};

class View {
public:
    View(std::vector<Source> sources, ProviderSet const &providers);

    std::vector<ServedArray> const &arrays() const {
        return arrays_;
    }
    std::vector<ServedContainer> const &containers() const {
        return containers_;
    }
    std::vector<Source> const &sources() const {
        return sources_;
    }
    /// Null for an id that no provider told.
    ServedContainer const *container(std::string_view id) const;
    ServedArray const *array(std::string_view id) const;
    /// The providers of a container's arrays, each once, in the order of the arrays.
    std::vector<ProviderPtr> providersOf(ServedContainer const &container) const;

private:
    void takeArrays(ProviderSet const &providers);
    void takeContainers(Source const &source);

    std::vector<Source> sources_; ///< owns all the facts
    std::vector<ServedArray> arrays_;
    std::vector<ServedContainer> containers_;
    std::unordered_map<std::string_view, uint32_t> arrayPlaces_;
    std::unordered_map<std::string_view, uint32_t> containerPlaces_;
};

} // namespace Lumod
