// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "Outages.h"
#include "View.h"

namespace Lumod {

/// Whether something can be reached through an endpoint now.
inline bool isUsable(Orka::Endpoint const &endpoint, Outages const &outages) {
    return endpoint.uid && endpoint.isAccessible && !outages.isOut(*endpoint.uid);
}

/// The endpoints through which one provider's volumes in a container can be reached now: those of the container's
/// arrays that the provider serves, in the arrays' order. The uids live as long as the view.
inline std::vector<std::string_view> usableEndpoints(View const &view, ServedContainer const &container,
                                                     ProviderPtr const &provider, Outages const &outages) {
    std::vector<std::string_view> uids;
    for (uint32_t const place : container.arrays) {
        ServedArray const &array = view.arrays()[place];
        if (array.provider != provider) {
            continue;
        }
        for (Orka::Endpoint const &endpoint : array.facts->endpoints) {
            if (isUsable(endpoint, outages)) {
                uids.push_back(*endpoint.uid);
            }
        }
    }
    return uids;
}

} // namespace Lumod
