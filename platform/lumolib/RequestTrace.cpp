// SPDX-License-Identifier: Apache-2.0
#include "RequestTrace.h"

#include <iterator>

#include "lumolib/Trace.h"

namespace LumoClient {

namespace {

LumoTraceReceiver receiver = nullptr;
void *receiverContext = nullptr;

/// In the order of the schema's union; a test compares the two.
constexpr char const *methods[] = {"ping",
                                   "getStorageContainer",
                                   "findStorageContainer",
                                   "queryAllConfigLumos",
                                   "activateProvider",
                                   "deactivateProvider",
                                   "vendorProviderInjectFault",
                                   "setFaultInjectionEnabled",
                                   "addFaultInjectionRule",
                                   "modifyFaultInjectionRule",
                                   "debugCommand",
                                   "setSpaceEfficiencyManipulationEnabled",
                                   "spaceStatsForLumo",
                                   "getLumoInfo",
                                   "unsharedChunksLumo",
                                   "getLumoMetadata",
                                   "createVirtualVolume",
                                   "bindVirtualVolume",
                                   "unbindVirtualVolume",
                                   "deleteVirtualVolume",
                                   "checkLumoAccessibility",
                                   "protocolEndpointEvent"};

} // namespace

char const *methodName(std::uint16_t place) noexcept {
    return place < std::size(methods) ? methods[place] : "unknown";
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
