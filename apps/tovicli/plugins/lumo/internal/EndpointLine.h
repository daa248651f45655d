// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "lumolib/LumoLib.h"

namespace TarselCli::LumoNamespace {

/// One protocol endpoint as a line of text, for example
/// `PE #0 (localUID: 3e7f01, isAccessible: 1, isConfigured: 0, type: NFS, ipAddress: 10.0.0.5, serverMount: /pe1)`.
/// A text that the daemon does not know ends the line at its label; a transport that is not SCSI, NFS or NFS4x ends it
/// behind isConfigured.
/// @param index the endpoint's place within its array, from 0
std::string endpointLine(int32_t index, ProtocolEndpointInfo const &endpoint);

} // namespace TarselCli::LumoNamespace
