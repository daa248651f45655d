// SPDX-License-Identifier: Apache-2.0
#include "conformance/Ground.h"

#include <algorithm>

#include "conformance/Expect.h"

namespace Orka::Conformance {

namespace {

bool holds(StorageContainer const &container, StorageArray const &array) {
    return std::find(container.arrayIds.begin(), container.arrayIds.end(), array.id) != container.arrayIds.end();
}

std::string const &orInapplicable(std::optional<std::string> const &uid, char const *why) {
    if (!uid) {
        throw Inapplicable{why};
    }
    return *uid;
}

} // namespace

Ground::Ground(std::vector<StorageArray> arrays, std::vector<StorageContainer> containers)
    : arrays_(std::move(arrays))
    , containers_(std::move(containers)) {
    for (size_t index = 0; index < containers_.size(); ++index) {
        auto endpoints = usableEndpoints(containers_[index]);
        if (!container_ || endpoints.size() > endpoints_.size()) {
            container_ = index;
            endpoints_ = std::move(endpoints);
        }
    }
    for (auto const &array : arrays_) {
        for (auto const &endpoint : array.endpoints) {
            if (!endpoint.uid || !container_) {
                continue;
            }
            bool const own = holds(container(), array);
            if (own && !endpoint.isAccessible && !inaccessibleEndpoint_) {
                inaccessibleEndpoint_ = endpoint.uid;
            } else if (!own && !foreignEndpoint_) {
                foreignEndpoint_ = endpoint.uid;
            }
        }
    }
}

std::vector<std::string> Ground::usableEndpoints(StorageContainer const &container) const {
    std::vector<std::string> uids;
    for (auto const &array : arrays_) {
        for (auto const &endpoint : array.endpoints) {
            if (holds(container, array) && endpoint.uid && endpoint.isAccessible) {
                uids.push_back(*endpoint.uid);
            }
        }
    }
    return uids;
}

StorageContainer const &Ground::container() const {
    if (!container_) {
        throw Inapplicable{"the provider exports no storage container"};
    }
    return containers_[*container_];
}

StorageContainer const &Ground::otherContainer() const {
    if (containers_.size() < 2) {
        throw Inapplicable{"the provider exports one storage container only"};
    }
    return containers_[*container_ == 0 ? 1 : 0];
}

std::vector<StorageContainer> Ground::touched() const {
    std::vector<StorageContainer> both;
    if (container_) {
        both.push_back(container());
    }
    if (containers_.size() > 1) {
        both.push_back(otherContainer());
    }
    return both;
}

std::string const &Ground::endpoint() const {
    if (endpoints_.empty()) {
        throw Inapplicable{"no storage container has a protocol endpoint that can be bound to"};
    }
    return endpoints_[0];
}

std::string const &Ground::secondEndpoint() const {
    if (endpoints_.size() < 2) {
        throw Inapplicable{"no storage container has two protocol endpoints that can be bound to"};
    }
    return endpoints_[1];
}

std::string const &Ground::inaccessibleEndpoint() const {
    return orInapplicable(inaccessibleEndpoint_, "every protocol endpoint of the storage container is accessible");
}

std::string const &Ground::foreignEndpoint() const {
    return orInapplicable(foreignEndpoint_, "every storage array with endpoints holds the storage container");
}

} // namespace Orka::Conformance
