// SPDX-License-Identifier: Apache-2.0
#include "RequestTrace.h"

#include <iterator>

#include "lumolib/Trace.h"
#include "wire/lumod.compact.h"

namespace LumoClient {

namespace {

LumoTraceReceiver receiver = nullptr;
void *receiverContext = nullptr;

using Wire::Compact::Request;

struct Method {
    Request::Which which;
    char const *name;
};

/// In the order of the schema's union.
constexpr Method methods[] = {
    {Request::PING, "ping"},
    {Request::GET_STORAGE_CONTAINER, "getStorageContainer"},
    {Request::FIND_STORAGE_CONTAINER, "findStorageContainer"},
    {Request::QUERY_ALL_CONFIG_LUMOS, "queryAllConfigLumos"},
    {Request::ACTIVATE_PROVIDER, "activateProvider"},
    {Request::DEACTIVATE_PROVIDER, "deactivateProvider"},
    {Request::VENDOR_PROVIDER_INJECT_FAULT, "vendorProviderInjectFault"},
    {Request::SET_FAULT_INJECTION_ENABLED, "setFaultInjectionEnabled"},
    {Request::ADD_FAULT_INJECTION_RULE, "addFaultInjectionRule"},
    {Request::MODIFY_FAULT_INJECTION_RULE, "modifyFaultInjectionRule"},
    {Request::DEBUG_COMMAND, "debugCommand"},
    {Request::SET_SPACE_EFFICIENCY_MANIPULATION_ENABLED, "setSpaceEfficiencyManipulationEnabled"},
    {Request::SPACE_STATS_FOR_LUMO, "spaceStatsForLumo"},
    {Request::GET_LUMO_INFO, "getLumoInfo"},
    {Request::UNSHARED_CHUNKS_LUMO, "unsharedChunksLumo"},
    {Request::GET_LUMO_METADATA, "getLumoMetadata"},
    {Request::CREATE_VIRTUAL_VOLUME, "createVirtualVolume"},
    {Request::BIND_VIRTUAL_VOLUME, "bindVirtualVolume"},
    {Request::UNBIND_VIRTUAL_VOLUME, "unbindVirtualVolume"},
    {Request::DELETE_VIRTUAL_VOLUME, "deleteVirtualVolume"},
    {Request::CHECK_LUMO_ACCESSIBILITY, "checkLumoAccessibility"},
    {Request::PROTOCOL_ENDPOINT_EVENT, "protocolEndpointEvent"},
};

constexpr bool isInOrder() {
    for (std::size_t place = 0; place < std::size(methods); ++place) {
        if (methods[place].which != place) {
            return false;
        }
    }
    return true;
}
static_assert(isInOrder(), "a name would stand for another method");

} // namespace

char const *methodName(std::uint16_t place) noexcept {
    return place < std::size(methods) ? methods[place].name : "unknown";
}

RequestTrace::RequestTrace(std::string const &socketPath, std::string const &requestId, Traffic const &traffic)
    : socketPath_(socketPath)
    , requestId_(requestId)
    , traffic_(traffic) {
    if (receiver != nullptr) {
        started_ = std::chrono::steady_clock::now();
    }
}

RequestTrace::~RequestTrace() {
    if (receiver == nullptr) {
        return;
    }
    auto const took =
        std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - started_);
    LumoRequestTrace const trace{methodName(traffic_.method),
                                 requestId_.c_str(),
                                 socketPath_.c_str(),
                                 traffic_.sentBytes,
                                 traffic_.receivedBytes,
                                 traffic_.replies,
                                 static_cast<std::int32_t>(code_),
                                 static_cast<std::uint64_t>(took.count())};
    receiver(receiverContext, &trace);
}

} // namespace LumoClient

void LumoPlatform_TraceRequests(LumoTraceReceiver newReceiver, void *context) {
    LumoClient::receiver = newReceiver;
    LumoClient::receiverContext = context;
}
