// SPDX-License-Identifier: Apache-2.0
#include "FaultNames.h"

namespace Lumod {

namespace {

constexpr std::array<char const *, operationCount> operationNames{
    "createVirtualVolume",         "deleteVirtualVolume",   "bindVirtualVolume",  "unbindVirtualVolume",
    "queryStorageArray",           "queryStorageContainer", "queryVirtualVolume", "spaceStatsForVirtualVolume",
    "unsharedChunksVirtualVolume", "getMetadata",           "setContext",
};

constexpr uint32_t bit(Operation operation) {
    return uint32_t{1} << static_cast<std::size_t>(operation);
}

constexpr uint32_t everything = (uint32_t{1} << operationCount) - 1;
/// What changes something on the array.
constexpr uint32_t changes = bit(Operation::CreateVirtualVolume) | bit(Operation::DeleteVirtualVolume) |
                             bit(Operation::BindVirtualVolume) | bit(Operation::UnbindVirtualVolume);
/// What needs room on the array, or a place at an endpoint.
constexpr uint32_t takesRoom = bit(Operation::CreateVirtualVolume) | bit(Operation::BindVirtualVolume);
/// What names an object that may be missing: a container, a volume or an endpoint.
constexpr uint32_t namesAnObject = changes | bit(Operation::QueryVirtualVolume) |
                                   bit(Operation::SpaceStatsForVirtualVolume) |
                                   bit(Operation::UnsharedChunksVirtualVolume) | bit(Operation::GetMetadata);

struct FaultFacts {
    char const *name;
    Wire::ErrorCode code;
    uint32_t legal;
};

constexpr std::array<FaultFacts, faultCount> faults{{
    {"STORAGE_FAULT", Wire::ErrorCode::FaultStorageFault, everything},
    {"OUT_OF_RESOURCE", Wire::ErrorCode::FaultOutOfResource, takesRoom},
    {"RESOURCE_BUSY", Wire::ErrorCode::FaultResourceBusy, changes},
    {"PERMISSION_DENIED", Wire::ErrorCode::FaultPermissionDenied, everything},
    {"NOT_FOUND", Wire::ErrorCode::FaultNotFound, namesAnObject},
    {"TIMEOUT", Wire::ErrorCode::FaultTimeout, everything},
    {"LOST_SESSION", Wire::ErrorCode::FaultLostSession, everything},
}};

FaultFacts const &factsOf(Fault fault) {
    return faults[static_cast<std::size_t>(fault)];
}

} // namespace

char const *nameOf(Operation operation) {
    return operationNames[static_cast<std::size_t>(operation)];
}

char const *nameOf(Fault fault) {
    return factsOf(fault).name;
}

std::optional<Operation> operationNamed(std::string_view name) {
    for (std::size_t index = 0; index < operationCount; ++index) {
        if (operationNames[index] == name) {
            return static_cast<Operation>(index);
        }
    }
    return std::nullopt;
}

std::optional<Fault> faultNamed(std::string_view name) {
    for (std::size_t index = 0; index < faultCount; ++index) {
        if (faults[index].name == name) {
            return static_cast<Fault>(index);
        }
    }
    return std::nullopt;
}

Wire::ErrorCode codeOf(Fault fault) {
    return factsOf(fault).code;
}

bool isLegal(Fault fault, Operation operation) {
    return (factsOf(fault).legal & bit(operation)) != 0;
}

} // namespace Lumod
