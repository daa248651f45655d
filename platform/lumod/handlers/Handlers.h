// SPDX-License-Identifier: Apache-2.0
//
// One function a method of the schema, each in the file of its name. A handler reads its request, and returns what
// answers it or a failure; it may throw a Wire::Failure before it returns. One that asks neither the host store nor a
// provider returns what answers, and is not waited for.
#pragma once

#include "Dispatch.h"

namespace Lumod {

ReplyPtr ping(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> getStorageContainer(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> findStorageContainer(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> queryAllConfigLumos(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> activateProvider(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> deactivateProvider(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> vendorProviderInjectFault(Core &core, CallPtr const &call, Wire::Request::Reader request);
ReplyPtr setFaultInjectionEnabled(Core &core, CallPtr const &call, Wire::Request::Reader request);
ReplyPtr addFaultInjectionRule(Core &core, CallPtr const &call, Wire::Request::Reader request);
ReplyPtr modifyFaultInjectionRule(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> debugCommand(Core &core, CallPtr const &call, Wire::Request::Reader request);
ReplyPtr setSpaceEfficiencyManipulationEnabled(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> spaceStatsForLumo(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> getLumoInfo(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> unsharedChunksLumo(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> getLumoMetadata(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> createVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> bindVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> unbindVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> deleteVirtualVolume(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> checkLumoAccessibility(Core &core, CallPtr const &call, Wire::Request::Reader request);
Answer<ReplyPtr> protocolEndpointEvent(Core &core, CallPtr const &call, Wire::Request::Reader request);

} // namespace Lumod
