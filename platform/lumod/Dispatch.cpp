// SPDX-License-Identifier: Apache-2.0
#include "Dispatch.h"

#include <algorithm>
#include <array>

#include <fmt/format.h>

#include "handlers/Handlers.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;
using Wire::Request;

namespace {

/// Every method of the schema. To add one: a line here, a declaration in handlers/Handlers.h, a file of its name.
constexpr std::array<Method, 22> methods{{
    {Request::PING, "ping", ping, true},
    {Request::GET_STORAGE_CONTAINER, "getStorageContainer", getStorageContainer, true},
    {Request::FIND_STORAGE_CONTAINER, "findStorageContainer", findStorageContainer, true},
    {Request::QUERY_ALL_CONFIG_LUMOS, "queryAllConfigLumos", queryAllConfigLumos, true},
    {Request::ACTIVATE_PROVIDER, "activateProvider", activateProvider, false},
    {Request::DEACTIVATE_PROVIDER, "deactivateProvider", deactivateProvider, false},
    {Request::VENDOR_PROVIDER_INJECT_FAULT, "vendorProviderInjectFault", vendorProviderInjectFault, false},
    {Request::SET_FAULT_INJECTION_ENABLED, "setFaultInjectionEnabled", setFaultInjectionEnabled, false},
    {Request::ADD_FAULT_INJECTION_RULE, "addFaultInjectionRule", addFaultInjectionRule, false},
    {Request::MODIFY_FAULT_INJECTION_RULE, "modifyFaultInjectionRule", modifyFaultInjectionRule, false},
    {Request::DEBUG_COMMAND, "debugCommand", debugCommand, false},
    {Request::SET_SPACE_EFFICIENCY_MANIPULATION_ENABLED, "setSpaceEfficiencyManipulationEnabled",
     setSpaceEfficiencyManipulationEnabled, false},
    {Request::SPACE_STATS_FOR_LUMO, "spaceStatsForLumo", spaceStatsForLumo, true},
    {Request::GET_LUMO_INFO, "getLumoInfo", getLumoInfo, true},
    {Request::UNSHARED_CHUNKS_LUMO, "unsharedChunksLumo", unsharedChunksLumo, true},
    {Request::GET_LUMO_METADATA, "getLumoMetadata", getLumoMetadata, true},
    {Request::CREATE_VIRTUAL_VOLUME, "createVirtualVolume", createVirtualVolume, false},
    {Request::BIND_VIRTUAL_VOLUME, "bindVirtualVolume", bindVirtualVolume, false},
    {Request::UNBIND_VIRTUAL_VOLUME, "unbindVirtualVolume", unbindVirtualVolume, false},
    {Request::DELETE_VIRTUAL_VOLUME, "deleteVirtualVolume", deleteVirtualVolume, false},
    {Request::CHECK_LUMO_ACCESSIBILITY, "checkLumoAccessibility", checkLumoAccessibility, true},
    {Request::PROTOCOL_ENDPOINT_EVENT, "protocolEndpointEvent", protocolEndpointEvent, false},
}};

/// @throws Failure UnsupportedVersion, UnknownMethod
Method const &requireMethod(Core &core, CallPtr const &call, Request::Reader request) {
    if (request.getVersion() != Wire::PROTOCOL_VERSION) {
        throw Failure(ErrorCode::UnsupportedVersion,
                      fmt::format("the request speaks version {} of the protocol; this daemon speaks version {}",
                                  request.getVersion(), Wire::PROTOCOL_VERSION));
    }
    Method const *const method = methodOf(request);
    if (method == nullptr) {
        throw Failure(ErrorCode::UnknownMethod, fmt::format("this daemon does not know the request with number {}",
                                                            static_cast<unsigned>(request.which())));
    }
    if (core.log.shows(LogLevel::Verbose)) {
        core.log.write(LogLevel::Verbose, call->trace, fmt::format("request {}", method->name));
    }
    return *method;
}

} // namespace

Method const *methodOf(Request::Reader request) {
    auto const *const found =
        std::find_if(methods.begin(), methods.end(),
                     [which = request.which()](Method const &method) { return method.which == which; });
    return found == methods.end() ? nullptr : found;
}

Dispatched dispatch(Core &core, CallPtr const &call, Request::Reader request) {
    try {
        Method const &method = requireMethod(core, call, request);
        if (auto const *prompt = std::get_if<PromptHandler>(&method.handler)) {
            return Outcome<ReplyPtr>((*prompt)(core, call, request));
        }
        return std::get<Handler>(method.handler)(core, call, request);
    } catch (Failure const &failure) {
        return Outcome<ReplyPtr>(failure);
    }
}

} // namespace Lumod
