// SPDX-License-Identifier: Apache-2.0
#include "ProviderArrays.h"

#include <algorithm>

#include <fmt/format.h>

namespace Lumod {

namespace {

bool exports(Source const &source, std::string const &arrayId) {
    return std::any_of(source.arrays.items->begin(), source.arrays.items->end(),
                       [&arrayId](Orka::StorageArray const &array) { return array.id == arrayId; });
}

} // namespace

void requireArray(Survey const &survey, ProviderEntry const &provider, std::string const &arrayId) {
    if (provider.listed(arrayId) != nullptr) {
        return;
    }
    if (provider.record.arrays.empty()) {
        for (Source const &source : survey.view->sources()) {
            if (source.provider.get() == &provider && exports(source, arrayId)) {
                return;
            }
        }
        for (auto const *absences : {&survey.failed, &survey.offline}) {
            for (Absence const &absence : *absences) {
                if (absence.provider.get() == &provider) {
                    throw absence.reason;
                }
            }
        }
    }
    throw Wire::Failure(Wire::ErrorCode::NoSuchArray,
                        fmt::format("the provider '{}' has no storage array '{}'", provider.record.name, arrayId));
}

ProviderPtr activeFor(Survey const &survey, ProviderSet const &providers, std::string const &arrayId) {
    std::vector<ProviderPtr> candidates;
    for (Source const &source : survey.view->sources()) {
        if (exports(source, arrayId)) {
            candidates.push_back(source.provider);
        }
    }
    for (Absence const &absence : survey.failed) {
        candidates.push_back(absence.provider);
    }
    return providers.serving(arrayId, candidates);
}

} // namespace Lumod
