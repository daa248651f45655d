// SPDX-License-Identifier: Apache-2.0
#include "BothApis.h"

namespace BothApis {

namespace {

/// Every getter of a list or structure is called once, in the same order on both sides: each call counts as a visit.
class Printer {
public:
    std::string result;

    void add(bool value) {
        result += value ? "yes " : "no ";
    }
    template <typename Number>
    requires std::is_integral_v<Number>
    void add(Number value) {
        result += std::to_string(value) + ' ';
    }
    void add(capnp::Text::Reader text) {
        result += '"' + std::string(text.begin(), text.size()) + "\" ";
    }
    void add(std::string_view text) {
        result += '"' + std::string(text) + "\" ";
    }
    void add(capnp::Data::Reader data) {
        result += '<' + std::string(reinterpret_cast<char const *>(data.begin()), data.size()) + "> ";
    }
    void add(std::span<std::uint8_t const> data) {
        result += '<' + std::string(reinterpret_cast<char const *>(data.data()), data.size()) + "> ";
    }
    template <typename List>
    void addEach(List list) {
        add(list.size());
        for (auto const element : list) {
            add(element);
        }
    }

    template <typename Key>
    void key(Key key) {
        add(key.getContainerId());
        add(key.getUuid());
        add(key.getDirectoryName());
    }

    template <typename Rule>
    void rule(Rule rule) {
        add(rule.getFault());
        add(rule.getOperation());
        add(rule.getFrequency());
        add(rule.getTimeMs());
    }

    template <typename Fault>
    void fault(Fault fault) {
        add(fault.getProviderName());
        add(fault.getProviderUrl());
        add(fault.getStatus());
        for (auto const array : fault.getArrays()) {
            add(array.getArrayId());
            add(array.getIsActive());
        }
    }

    template <typename Array>
    void array(Array array) {
        add(array.getId());
        add(array.getName());
        add(array.getVendorId());
        add(array.getModelId());
        for (auto const endpoint : array.getEndpoints()) {
            add(endpoint.hasUid());
            add(endpoint.getUid());
            add(endpoint.getType());
            add(endpoint.hasText1());
            add(endpoint.getText1());
            add(endpoint.hasText2());
            add(endpoint.getText2());
            addEach(endpoint.getAddresses());
            add(endpoint.getIsAccessible());
            add(endpoint.getIsConfigured());
        }
    }

    template <typename Container>
    void container(Container container) {
        add(container.getId());
        add(container.getName());
        add(container.getProviderUrl());
        add(container.getMaxLumoSizeMb());
        addEach(container.getArrays());
    }
};

template <typename Request>
bool addProviderRequest(Printer &out, Request request) {
    if (request.isActivateProvider()) {
        auto const activation = request.getActivateProvider();
        out.add(activation.getArrayId());
        out.add(activation.getProviderName());
        out.add(activation.getActiveProviderUrl());
    } else if (request.isDeactivateProvider()) {
        auto const deactivation = request.getDeactivateProvider();
        out.add(deactivation.getArrayId());
        out.add(deactivation.getProviderName());
    } else if (request.isVendorProviderInjectFault()) {
        out.fault(request.getVendorProviderInjectFault());
    } else if (request.isSetFaultInjectionEnabled()) {
        out.add(request.getSetFaultInjectionEnabled());
    } else if (request.isAddFaultInjectionRule()) {
        out.rule(request.getAddFaultInjectionRule());
    } else if (request.isModifyFaultInjectionRule()) {
        out.rule(request.getModifyFaultInjectionRule());
    } else if (request.isDebugCommand()) {
        auto const command = request.getDebugCommand();
        out.add(command.getLogLevel());
        out.add(command.getDump());
        out.add(command.getUnbindPeriodUs());
    } else if (request.isSetSpaceEfficiencyManipulationEnabled()) {
        out.add(request.getSetSpaceEfficiencyManipulationEnabled());
    } else {
        return false;
    }
    return true;
}

template <typename Request>
bool addVolumeRequest(Printer &out, Request request) {
    if (request.isSpaceStatsForLumo()) {
        out.key(request.getSpaceStatsForLumo());
    } else if (request.isGetLumoInfo()) {
        out.key(request.getGetLumoInfo());
    } else if (request.isUnsharedChunksLumo()) {
        out.key(request.getUnsharedChunksLumo());
    } else if (request.isGetLumoMetadata()) {
        out.key(request.getGetLumoMetadata());
    } else if (request.isBindVirtualVolume()) {
        out.key(request.getBindVirtualVolume());
    } else if (request.isUnbindVirtualVolume()) {
        out.key(request.getUnbindVirtualVolume());
    } else if (request.isDeleteVirtualVolume()) {
        out.key(request.getDeleteVirtualVolume());
    } else if (request.isCreateVirtualVolume()) {
        auto const creation = request.getCreateVirtualVolume();
        out.add(creation.getContainerId());
        out.add(creation.getDirectoryName());
        out.add(creation.getPolicy());
        out.add(creation.getSizeMb());
        out.add(creation.getVmUuid());
    } else if (request.isCheckLumoAccessibility()) {
        auto const check = request.getCheckLumoAccessibility();
        out.add(check.getContainerId());
        out.addEach(check.getLumoIds());
    } else if (request.isProtocolEndpointEvent()) {
        auto const event = request.getProtocolEndpointEvent();
        out.add(event.getEndpoint());
        out.add(event.getApd());
    } else {
        return false;
    }
    return true;
}

template <typename Request>
std::string printedRequest(Request request) {
    Printer out;
    out.add(static_cast<std::uint16_t>(request.which()));
    out.add(request.getVersion());
    out.add(request.getId());
    out.add(request.getDeadlineMs());
    out.add(request.hasTraceId());
    out.add(request.getTraceId());
    if (request.isFindStorageContainer()) {
        auto const query = request.getFindStorageContainer();
        out.add(query.getContainerId());
        out.addEach(query.getArrayIds());
    } else if (request.isQueryAllConfigLumos()) {
        auto const query = request.getQueryAllConfigLumos();
        out.add(query.getContainerId());
        out.add(query.getMax());
    } else if (!addProviderRequest(out, request)) {
        addVolumeRequest(out, request);
    }
    return out.result;
}

template <typename Reply>
bool addList(Printer &out, Reply reply) {
    if (reply.isStorageArrays()) {
        for (auto const array : reply.getStorageArrays()) {
            out.array(array);
        }
    } else if (reply.isStorageContainers()) {
        for (auto const container : reply.getStorageContainers()) {
            out.container(container);
        }
    } else if (reply.isConfigLumos()) {
        for (auto const lumo : reply.getConfigLumos()) {
            out.add(lumo.getUuid());
            out.add(lumo.getDirectoryName());
        }
    } else if (reply.isContainerNames()) {
        out.addEach(reply.getContainerNames());
    } else if (reply.isMetadata()) {
        for (auto const pair : reply.getMetadata()) {
            out.add(pair.getKey());
            out.add(pair.getValue());
        }
    } else {
        return false;
    }
    return true;
}

template <typename Reply>
void addOneThing(Printer &out, Reply reply) {
    if (reply.isFailure()) {
        auto const failure = reply.getFailure();
        out.add(failure.getCode());
        out.add(failure.getSentence());
    } else if (reply.isPong()) {
        auto const pong = reply.getPong();
        out.add(pong.getVersion());
        out.add(pong.getPid());
        out.add(pong.getUptimeMs());
        out.add(pong.getRoot());
    } else if (reply.isVolume()) {
        auto const volume = reply.getVolume();
        out.add(volume.getUuid());
        out.add(volume.getDirectoryName());
        out.add(volume.getEndpoint());
    } else if (reply.isAccessibility()) {
        out.add(reply.hasAccessibility());
        out.add(reply.getAccessibility());
    } else if (reply.isSpaceStats()) {
        auto const stats = reply.getSpaceStats();
        out.add(stats.getLogicalSizeMb());
        out.add(stats.getCommittedSizeMb());
        out.add(stats.getUnsharedSizeMb());
        out.add(stats.getUnsharedSizeValid());
    } else if (reply.isLumoInfo()) {
        auto const info = reply.getLumoInfo();
        out.add(info.hasStorageProfile());
        out.add(info.getStorageProfile());
    } else if (reply.isUnsharedChunks()) {
        auto const chunks = reply.getUnsharedChunks();
        out.add(chunks.getBlockSize());
        out.add(chunks.getBitmap());
    }
}

template <typename Reply>
std::string printedReply(Reply reply) {
    Printer out;
    out.add(static_cast<std::uint16_t>(reply.which()));
    out.add(reply.getId());
    out.add(reply.getLast());
    if (!addList(out, reply)) {
        addOneThing(out, reply);
    }
    return out.result;
}

} // namespace

std::string printed(Wire::Request::Reader request) {
    return printedRequest(request);
}

std::string printed(Wire::Compact::Request::Reader request) {
    return printedRequest(request);
}

std::string printed(Wire::Reply::Reader reply) {
    return printedReply(reply);
}

std::string printed(Wire::Compact::Reply::Reader reply) {
    return printedReply(reply);
}

} // namespace BothApis
