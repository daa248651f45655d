// SPDX-License-Identifier: Apache-2.0
#include "ProviderArrays.h"

using Gantry::Storage::RelatedStorageArrayInfo;
using Gantry::Storage::VendorProviderInfo;

namespace TarselCli::LumoNamespace {

std::optional<std::vector<RelatedStorageArrayInfo>> readProviderArrays(InputPtr const &input, OutputPtr const &output) {
    std::vector<std::string> const arrayIds = input->GetStringList("arrayid");
    std::vector<int64_t> const priorities = input->GetIntList("priority");
    std::vector<bool> const activeFlags = input->GetBoolList("isactive");
    if (arrayIds.size() != priorities.size() || arrayIds.size() != activeFlags.size()) {
        // What users' scripts look for, word for word.
        output->SetMessage("Missing one of the  parameter arrayIdor priority or isActive for an Array ");
        return std::nullopt;
    }
    std::vector<RelatedStorageArrayInfo> arrays;
    for (std::size_t i = 0; i < arrayIds.size(); ++i) {
        arrays.push_back({arrayIds[i], activeFlags[i], lowWord(priorities[i])});
    }
    return arrays;
}

VendorProviderInfo makeProvider(std::string const &name, std::string const &url,
                                std::vector<RelatedStorageArrayInfo> const &arrays) {
    return {name, url, "", arrays};
}

} // namespace TarselCli::LumoNamespace
