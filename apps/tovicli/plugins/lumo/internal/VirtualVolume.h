// SPDX-License-Identifier: Apache-2.0
//
// The virtual volume that an inspection command is asked about.
#pragma once

#include <optional>
#include <string>

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

struct VirtualVolume {
    /// In its canonical form.
    std::string containerId;
    std::string uuid;
};

InputSpecPtr declareVirtualVolumeParameters();

/// @return empty when the container id is none or the uuid is empty; the output then holds the message for it.
std::optional<VirtualVolume> readVirtualVolume(InputPtr const &input, OutputPtr const &output);

} // namespace TarselCli::LumoNamespace
