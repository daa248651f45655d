// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "orka/Model.h"

namespace Orka::Conformance {

/// What of an array the cases are tried on: the container with the most endpoints that can be bound to, and what lies
/// around it. Looked up once, before the first case. A getter throws Inapplicable where the array has nothing of the
/// kind.
class Ground {
public:
    Ground(std::vector<StorageArray> arrays, std::vector<StorageContainer> containers);

    std::vector<StorageArray> const &arrays() const {
        return arrays_;
    }
    std::vector<StorageContainer> const &containers() const {
        return containers_;
    }
    StorageContainer const &container() const;
    StorageContainer const &otherContainer() const;
    /// Those that cases make volumes in: none, one or both of these two. An array may have very many others.
    std::vector<StorageContainer> touched() const;
    /// Endpoints of the container's arrays that can be bound to.
    std::string const &endpoint() const;
    std::string const &secondEndpoint() const;
    /// One of the container's that the array says is not accessible.
    std::string const &inaccessibleEndpoint() const;
    /// One of an array that does not hold the container.
    std::string const &foreignEndpoint() const;

private:
    std::vector<std::string> usableEndpoints(StorageContainer const &container) const;

    std::vector<StorageArray> arrays_;
    std::vector<StorageContainer> containers_;
    std::optional<size_t> container_;
    std::vector<std::string> endpoints_;
    std::optional<std::string> inaccessibleEndpoint_;
    std::optional<std::string> foreignEndpoint_;
};

/// An id of the right form that no provider gives.
inline constexpr char const *unknownId = "ffffffff-ffff-4fff-bfff-fffffffffff0";

} // namespace Orka::Conformance
