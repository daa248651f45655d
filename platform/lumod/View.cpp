// SPDX-License-Identifier: Apache-2.0
#include "View.h"

#include <algorithm>
#include <utility>

namespace Lumod {

View::View(std::vector<Source> sources, ProviderSet const &providers)
    : sources_(std::move(sources)) {
    takeArrays(providers);
    std::size_t count = 0;
    for (Source const &source : sources_) {
        count += source.containers.items->size();
    }
    containers_.reserve(count);
    containerPlaces_.reserve(count);
    for (Source const &source : sources_) {
        takeContainers(source);
    }
    for (ServedContainer &container : containers_) {
        // What one provider does not serve, another may.
        auto const isServed = [&container](uint32_t place) {
            return std::find(container.arrays.begin(), container.arrays.end(), place) != container.arrays.end();
        };
        auto const served = std::remove_if(container.unserved.begin(), container.unserved.end(), isServed);
        container.unserved.erase(served, container.unserved.end());
    }
}

void View::takeArrays(ProviderSet const &providers) {
    struct Export {
        ProviderPtr provider;
        Orka::StorageArray const *facts;
    };
    std::vector<std::vector<Export>> exports;
    for (Source const &source : sources_) {
        for (Orka::StorageArray const &array : *source.arrays.items) {
            auto const place = arrayPlaces_.emplace(array.id, static_cast<uint32_t>(exports.size()));
            if (place.second) {
                exports.emplace_back();
            }
            exports[place.first->second].push_back({source.provider, &array});
        }
    }
    for (std::vector<Export> const &candidates : exports) {
        std::vector<ProviderPtr> exporters;
        for (Export const &candidate : candidates) {
            exporters.push_back(candidate.provider);
        }
        ProviderPtr const serving = providers.serving(candidates.front().facts->id, exporters);
        auto const chosen = std::find_if(candidates.begin(), candidates.end(),
                                         [&serving](Export const &each) { return each.provider == serving; });
        arrays_.push_back({chosen == candidates.end() ? candidates.front().facts : chosen->facts, serving});
    }
}

void View::takeContainers(Source const &source) {
    for (Orka::StorageContainer const &container : *source.containers.items) {
        auto const place = containerPlaces_.emplace(container.id, static_cast<uint32_t>(containers_.size()));
        if (place.second) {
            containers_.push_back({&container, source.provider, {}, {}});
        }
        ServedContainer &entry = containers_[place.first->second];
        for (std::string const &arrayId : container.arrayIds) {
            auto const array = arrayPlaces_.find(arrayId);
            if (array == arrayPlaces_.end()) {
                continue;
            }
            if (arrays_[array->second].provider != source.provider) {
                entry.unserved.push_back(array->second);
                continue;
            }
            if (entry.arrays.empty()) {
                entry.facts = &container;
                entry.provider = source.provider;
            }
            entry.arrays.push_back(array->second);
        }
    }
}

ServedContainer const *View::container(std::string_view id) const {
    auto const place = containerPlaces_.find(id);
    return place == containerPlaces_.end() ? nullptr : &containers_[place->second];
}

ServedArray const *View::array(std::string_view id) const {
    auto const place = arrayPlaces_.find(id);
    return place == arrayPlaces_.end() ? nullptr : &arrays_[place->second];
}

std::vector<ProviderPtr> View::providersOf(ServedContainer const &container) const {
    std::vector<ProviderPtr> providers;
    if (container.arrays.empty()) {
        providers.push_back(container.provider);
    }
    for (uint32_t const place : container.arrays) {
        ProviderPtr const &provider = arrays_[place].provider;
        if (std::find(providers.begin(), providers.end(), provider) == providers.end()) {
            providers.push_back(provider);
        }
    }
    return providers;
}

} // namespace Lumod
