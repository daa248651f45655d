// SPDX-License-Identifier: Apache-2.0
#include "EndpointLine.h"

#include <sstream>
#include <vector>

#include "DaemonText.h"
#include "kestrel/Util.h"

namespace TarselCli::LumoNamespace {
namespace {

std::string joinedAddresses(ProtocolEndpointInfo const &endpoint) {
    std::vector<std::string> addresses;
    for (int32_t i = 0; i < endpoint.nfs4xAddressCount; ++i) {
        addresses.push_back(textOrEmpty(endpoint.nfs4xAddresses[i]));
    }
    return Kestrel::Util::VectorToString(addresses, ",");
}

} // namespace

std::string endpointLine(int32_t index, ProtocolEndpointInfo const &endpoint) {
    std::ostringstream line;
    line << "PE #" << index << " (localUID: ";
    writeText(line, endpoint.localUID);
    line << ", isAccessible: " << (endpoint.isAccessible != 0) << ", isConfigured: " << (endpoint.isConfigured != 0);
    if (endpoint.transport == nullptr) {
        return line.str();
    }
    EndpointTransportInfo const &transport = *endpoint.transport;
    switch (transport.type) {
    case EndpointTransportScsi:
        line << ", type: SCSI"
             << ", lunID: ";
        writeText(line, transport.text1);
        line << ")";
        break;
    case EndpointTransportNfs:
        line << ", type: NFS"
             << ", ipAddress: ";
        writeText(line, transport.text1);
        line << ", serverMount: ";
        writeText(line, transport.text2);
        line << ")";
        break;
    case EndpointTransportNfs4x:
        line << ", type: NFS4x"
             << ", ipAddress(es): " << joinedAddresses(endpoint) << ", serverMount: ";
        writeText(line, transport.text1);
        line << ")";
        break;
    default:
        break;
    }
    return line.str();
}

} // namespace TarselCli::LumoNamespace
