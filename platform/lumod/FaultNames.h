// SPDX-License-Identifier: Apache-2.0
//
// The faults that can be injected, the provider operations that they can strike, and which goes with which. The table
// in FaultNames.cpp is the one that docs/fault-rules.md shows to users.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include "wire/ErrorCode.h"

namespace Lumod {

/// What the daemon asks of providers, as users name it in a rule.
enum class Operation : std::size_t {
    CreateVirtualVolume,
    DeleteVirtualVolume,
    BindVirtualVolume,
    UnbindVirtualVolume,
    QueryStorageArray,
    QueryStorageContainer,
    QueryVirtualVolume,
    SpaceStatsForVirtualVolume,
    UnsharedChunksVirtualVolume,
    GetMetadata,
    SetContext,
};
inline constexpr std::size_t operationCount = 11;

enum class Fault : std::size_t {
    StorageFault,
    OutOfResource,
    ResourceBusy,
    PermissionDenied,
    NotFound,
    Timeout,
    LostSession,
};
inline constexpr std::size_t faultCount = 7;

char const *nameOf(Operation operation);
char const *nameOf(Fault fault);
std::optional<Operation> operationNamed(std::string_view name);
std::optional<Fault> faultNamed(std::string_view name);
Wire::ErrorCode codeOf(Fault fault);
bool isLegal(Fault fault, Operation operation);

} // namespace Lumod
