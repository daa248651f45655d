// SPDX-License-Identifier: Apache-2.0
#include "BothApis.h"

#include <cstring>

namespace BothApis {

std::uint64_t Choices::number() {
    std::uint64_t result = 0;
    for (unsigned bytes = byte() % 9; bytes > 0; --bytes) {
        result = result << 8 | byte();
    }
    return result;
}

TextArgument Choices::text() {
    text_.assign(byte() % 20, static_cast<char>(byte()));
    return {text_};
}

DataArgument Choices::data() {
    data_.assign(byte() % 20, byte());
    return {data_};
}

namespace {

template <typename Key>
void fillKey(Key key, Choices &choices) {
    key.setContainerId(choices.text());
    key.setUuid(choices.text());
    key.setDirectoryName(choices.text());
}

template <typename Rule>
void fillRule(Rule rule, Choices &choices) {
    rule.setFault(choices.text());
    rule.setOperation(choices.text());
    rule.setFrequency(static_cast<std::int32_t>(choices.number()));
    rule.setTimeMs(static_cast<std::int32_t>(choices.number()));
}

template <typename List>
void fillTexts(List list, Choices &choices) {
    for (unsigned place = 0; place < list.size(); ++place) {
        if (choices.flag()) {
            list.set(place, choices.text());
        }
    }
}

template <typename Request>
void fillProviderRequest(Request request, unsigned kind, Choices &choices) {
    switch (kind) {
    case Wire::Request::ACTIVATE_PROVIDER: {
        auto activation = request.initActivateProvider();
        activation.setArrayId(choices.text());
        activation.setProviderName(choices.text());
        activation.setActiveProviderUrl(choices.text());
        break;
    }
    case Wire::Request::DEACTIVATE_PROVIDER: {
        auto deactivation = request.initDeactivateProvider();
        deactivation.setArrayId(choices.text());
        deactivation.setProviderName(choices.text());
        break;
    }
    case Wire::Request::VENDOR_PROVIDER_INJECT_FAULT: {
        auto fault = request.initVendorProviderInjectFault();
        fault.setProviderName(choices.text());
        fault.setProviderUrl(choices.text());
        fault.setStatus(choices.text());
        auto arrays = fault.initArrays(choices.length());
        for (unsigned place = 0; place < arrays.size(); ++place) {
            arrays[place].setIsActive(choices.flag());
            arrays[place].setArrayId(choices.text());
        }
        break;
    }
    case Wire::Request::SET_FAULT_INJECTION_ENABLED:
        request.setSetFaultInjectionEnabled(choices.flag());
        break;
    case Wire::Request::ADD_FAULT_INJECTION_RULE:
        fillRule(request.initAddFaultInjectionRule(), choices);
        break;
    case Wire::Request::MODIFY_FAULT_INJECTION_RULE:
        fillRule(request.initModifyFaultInjectionRule(), choices);
        break;
    case Wire::Request::DEBUG_COMMAND: {
        auto command = request.initDebugCommand();
        command.setLogLevel(static_cast<std::int64_t>(choices.number()));
        if (choices.flag()) {
            command.setDump(static_cast<std::int64_t>(choices.number()));
        }
        command.setUnbindPeriodUs(static_cast<std::int64_t>(choices.number()));
        break;
    }
    default:
        request.setSetSpaceEfficiencyManipulationEnabled(choices.flag());
        break;
    }
}

template <typename Request>
void fillVolumeRequest(Request request, unsigned kind, Choices &choices) {
    switch (kind) {
    case Wire::Request::SPACE_STATS_FOR_LUMO:
        return fillKey(request.initSpaceStatsForLumo(), choices);
    case Wire::Request::GET_LUMO_INFO:
        return fillKey(request.initGetLumoInfo(), choices);
    case Wire::Request::UNSHARED_CHUNKS_LUMO:
        return fillKey(request.initUnsharedChunksLumo(), choices);
    case Wire::Request::GET_LUMO_METADATA:
        return fillKey(request.initGetLumoMetadata(), choices);
    case Wire::Request::BIND_VIRTUAL_VOLUME:
        return fillKey(request.initBindVirtualVolume(), choices);
    case Wire::Request::UNBIND_VIRTUAL_VOLUME:
        return fillKey(request.initUnbindVirtualVolume(), choices);
    case Wire::Request::DELETE_VIRTUAL_VOLUME:
        return fillKey(request.initDeleteVirtualVolume(), choices);
    case Wire::Request::CREATE_VIRTUAL_VOLUME: {
        auto creation = request.initCreateVirtualVolume();
        creation.setContainerId(choices.text());
        creation.setDirectoryName(choices.text());
        creation.setPolicy(choices.text());
        creation.setSizeMb(static_cast<std::int64_t>(choices.number()));
        creation.setVmUuid(choices.text());
        break;
    }
    case Wire::Request::CHECK_LUMO_ACCESSIBILITY: {
        auto check = request.initCheckLumoAccessibility();
        check.setContainerId(choices.text());
        fillTexts(check.initLumoIds(choices.length()), choices);
        break;
    }
    default: {
        auto event = request.initProtocolEndpointEvent();
        event.setEndpoint(choices.text());
        event.setApd(choices.flag());
        break;
    }
    }
}

template <typename Request>
void fillRequest(Request request, unsigned kind, Choices choices) {
    request.setVersion(static_cast<std::uint16_t>(choices.number()));
    request.setId(choices.number());
    request.setDeadlineMs(static_cast<std::uint32_t>(choices.number()));
    if (choices.flag()) {
        request.setTraceId(choices.text());
    }
    if (kind == Wire::Request::PING) {
        request.setPing();
    } else if (kind == Wire::Request::GET_STORAGE_CONTAINER) {
        request.setGetStorageContainer();
    } else if (kind == Wire::Request::FIND_STORAGE_CONTAINER) {
        auto query = request.initFindStorageContainer();
        query.setContainerId(choices.text());
        fillTexts(query.initArrayIds(choices.length()), choices);
    } else if (kind == Wire::Request::QUERY_ALL_CONFIG_LUMOS) {
        auto query = request.initQueryAllConfigLumos();
        query.setContainerId(choices.text());
        query.setMax(static_cast<std::int32_t>(choices.number()));
    } else if (kind < Wire::Request::SPACE_STATS_FOR_LUMO) {
        fillProviderRequest(request, kind, choices);
    } else {
        fillVolumeRequest(request, kind, choices);
    }
}

template <typename List>
void fillArrays(List arrays, Choices &choices) {
    for (unsigned place = 0; place < arrays.size(); ++place) {
        auto array = arrays[place];
        array.setId(choices.text());
        array.setName(choices.text());
        array.setVendorId(choices.text());
        array.setModelId(choices.text());
        auto endpoints = array.initEndpoints(choices.length());
        for (unsigned number = 0; number < endpoints.size(); ++number) {
            auto endpoint = endpoints[number];
            if (choices.flag()) {
                endpoint.setUid(choices.text());
            }
            endpoint.setType(static_cast<std::int32_t>(choices.number()));
            if (choices.flag()) {
                endpoint.setText1(choices.text());
                endpoint.setText2(choices.text());
            }
            fillTexts(endpoint.initAddresses(choices.length()), choices);
            endpoint.setIsAccessible(choices.flag());
            endpoint.setIsConfigured(choices.flag());
        }
    }
}

template <typename List>
void fillContainers(List containers, Choices &choices) {
    for (unsigned place = 0; place < containers.size(); ++place) {
        auto container = containers[place];
        container.setId(choices.text());
        container.setName(choices.text());
        container.setProviderUrl(choices.text());
        container.setMaxLumoSizeMb(static_cast<std::int64_t>(choices.number()));
        auto arrays = container.initArrays(choices.length());
        for (unsigned number = 0; number < arrays.size(); ++number) {
            arrays.set(number, static_cast<std::uint32_t>(choices.number()));
        }
    }
}

template <typename Reply>
void fillOneThing(Reply reply, unsigned kind, Choices &choices) {
    if (kind == Wire::Reply::FAILURE) {
        auto failure = reply.initFailure();
        failure.setCode(static_cast<std::int32_t>(choices.number()));
        failure.setSentence(choices.text());
    } else if (kind == Wire::Reply::DONE) {
        reply.setDone();
    } else if (kind == Wire::Reply::PONG) {
        auto pong = reply.initPong();
        pong.setVersion(choices.text());
        pong.setPid(static_cast<std::uint32_t>(choices.number()));
        pong.setUptimeMs(choices.number());
        pong.setRoot(choices.text());
    } else if (kind == Wire::Reply::VOLUME) {
        auto volume = reply.initVolume();
        volume.setUuid(choices.text());
        volume.setDirectoryName(choices.text());
        volume.setEndpoint(choices.text());
    } else if (kind == Wire::Reply::ACCESSIBILITY) {
        reply.setAccessibility(choices.data());
    } else if (kind == Wire::Reply::SPACE_STATS) {
        auto stats = reply.initSpaceStats();
        stats.setLogicalSizeMb(static_cast<std::int64_t>(choices.number()));
        stats.setCommittedSizeMb(static_cast<std::int64_t>(choices.number()));
        stats.setUnsharedSizeMb(static_cast<std::int64_t>(choices.number()));
        stats.setUnsharedSizeValid(choices.flag());
    } else if (kind == Wire::Reply::LUMO_INFO) {
        auto info = reply.initLumoInfo();
        if (choices.flag()) {
            info.setStorageProfile(choices.text());
        }
    } else {
        auto chunks = reply.initUnsharedChunks();
        chunks.setBlockSize(static_cast<std::int64_t>(choices.number()));
        chunks.setBitmap(choices.data());
    }
}

template <typename Reply>
void fillReply(Reply reply, unsigned kind, Choices choices) {
    reply.setId(choices.number());
    reply.setLast(choices.flag());
    if (kind == Wire::Reply::STORAGE_ARRAYS) {
        fillArrays(reply.initStorageArrays(choices.length()), choices);
    } else if (kind == Wire::Reply::STORAGE_CONTAINERS) {
        fillContainers(reply.initStorageContainers(choices.length()), choices);
    } else if (kind == Wire::Reply::CONFIG_LUMOS) {
        auto lumos = reply.initConfigLumos(choices.length());
        for (unsigned place = 0; place < lumos.size(); ++place) {
            lumos[place].setUuid(choices.text());
            lumos[place].setDirectoryName(choices.text());
        }
    } else if (kind == Wire::Reply::CONTAINER_NAMES) {
        fillTexts(reply.initContainerNames(choices.length()), choices);
    } else if (kind == Wire::Reply::METADATA) {
        auto pairs = reply.initMetadata(choices.length());
        for (unsigned place = 0; place < pairs.size(); ++place) {
            pairs[place].setKey(choices.text());
            pairs[place].setValue(choices.text());
        }
    } else {
        fillOneThing(reply, kind, choices);
    }
}

} // namespace

void fill(Wire::Request::Builder request, unsigned kind, Choices choices) {
    fillRequest(request, kind, std::move(choices));
}

void fill(Wire::Compact::Request::Builder request, unsigned kind, Choices choices) {
    fillRequest(request, kind, std::move(choices));
}

void fill(Wire::Reply::Builder reply, unsigned kind, Choices choices) {
    fillReply(reply, kind, std::move(choices));
}

void fill(Wire::Compact::Reply::Builder reply, unsigned kind, Choices choices) {
    fillReply(reply, kind, std::move(choices));
}

} // namespace BothApis
