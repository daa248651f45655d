// SPDX-License-Identifier: Apache-2.0
#include <functional>
#include <string>

#include <capnp/message.h>
#include <capnp/serialize.h>

#include "Seeds.h"
#include "wire/lumod.capnp.h"

namespace Fuzz {

namespace {

using Request = Wire::Request::Builder;
using Fill = std::function<void(Request)>;

constexpr char const *container = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
constexpr char const *volume = "00000000-0000-4000-8000-000000000001";

std::string streamed(Fill const &fill) {
    capnp::MallocMessageBuilder message;
    auto request = message.initRoot<Wire::Request>();
    request.setVersion(Wire::PROTOCOL_VERSION);
    request.setId(1);
    request.setDeadlineMs(5000);
    request.setTraceId("trace");
    fill(request);
    auto const words = capnp::messageToFlatArray(message);
    return {words.asChars().begin(), words.asChars().size()};
}

void key(Wire::VolumeKey::Builder key) {
    key.setContainerId(container);
    key.setUuid(volume);
}

void rule(Wire::FaultInjectionRule::Builder rule) {
    rule.setFault("STORAGE_FAULT");
    rule.setOperation("*");
    rule.setFrequency(2);
}

void keepVolumeRequests(std::function<void(char const *name, Fill const &fill)> const &keep) {
    keep("space_stats", [](Request request) { key(request.initSpaceStatsForLumo()); });
    keep("lumo_info", [](Request request) { key(request.initGetLumoInfo()); });
    keep("unshared_chunks", [](Request request) { key(request.initUnsharedChunksLumo()); });
    keep("metadata", [](Request request) { key(request.initGetLumoMetadata()); });
    keep("bind", [](Request request) { key(request.initBindVirtualVolume()); });
    keep("unbind", [](Request request) { key(request.initUnbindVirtualVolume()); });
    keep("delete", [](Request request) { key(request.initDeleteVirtualVolume()); });
    keep("create", [](Request request) {
        auto creation = request.initCreateVirtualVolume();
        creation.setContainerId(container);
        creation.setDirectoryName("new");
        creation.setPolicy("policy");
        creation.setSizeMb(7);
    });
    keep("accessibility", [](Request request) {
        auto check = request.initCheckLumoAccessibility();
        check.setContainerId(container);
        check.initLumoIds(2).set(0, volume);
    });
}

void keepProviderRequests(std::function<void(char const *name, Fill const &fill)> const &keep) {
    keep("activate", [](Request request) {
        auto activation = request.initActivateProvider();
        activation.setArrayId("array");
        activation.setProviderName("provider");
        activation.setActiveProviderUrl("fake:provider");
    });
    keep("deactivate", [](Request request) {
        auto deactivation = request.initDeactivateProvider();
        deactivation.setArrayId("array");
        deactivation.setProviderName("provider");
    });
    keep("inject", [](Request request) {
        auto injection = request.initVendorProviderInjectFault();
        injection.setProviderName("provider");
        injection.setProviderUrl("fake:provider");
        injection.setStatus("syncError");
        injection.initArrays(1)[0].setArrayId("array");
    });
    keep("faults_on", [](Request request) { request.setSetFaultInjectionEnabled(true); });
    keep("add_rule", [](Request request) { rule(request.initAddFaultInjectionRule()); });
    keep("modify_rule", [](Request request) { rule(request.initModifyFaultInjectionRule()); });
    keep("debug", [](Request request) {
        auto command = request.initDebugCommand();
        command.setLogLevel(64);
        command.setDump(1);
        command.setUnbindPeriodUs(0);
    });
    keep("space_efficiency", [](Request request) { request.setSetSpaceEfficiencyManipulationEnabled(true); });
    keep("apd", [](Request request) {
        auto event = request.initProtocolEndpointEvent();
        event.setEndpoint("endpoint");
        event.setApd(true);
    });
}

} // namespace

void makeRequestSeeds(Keep const &keep) {
    std::string all(1, '\0');
    auto const put = [&](char const *name, Fill const &fill) {
        std::string const message = streamed(fill);
        keep(name, std::string(1, '\1') + message);
        all += message;
    };
    put("ping", [](Request request) { request.setPing(); });
    put("containers", [](Request request) { request.setGetStorageContainer(); });
    put("find_container", [](Request request) {
        auto query = request.initFindStorageContainer();
        query.setContainerId(container);
        query.initArrayIds(1).set(0, "array");
    });
    put("config_lumos", [](Request request) {
        auto query = request.initQueryAllConfigLumos();
        query.setContainerId(container);
        query.setMax(10);
    });
    keepProviderRequests(put);
    keepVolumeRequests(put);
    keep("one_after_the_other", all);
}

} // namespace Fuzz
