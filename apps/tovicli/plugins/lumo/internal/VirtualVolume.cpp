// SPDX-License-Identifier: Apache-2.0
#include "VirtualVolume.h"

#include <array>

#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

InputSpecPtr declareVirtualVolumeParameters() {
    return declareParameters({
        {"container-id", CallSpec::String, "c", true, "The storage container the Lumo is in."},
        {"uuid", CallSpec::String, "u", true, "The Lumo UUID."},
    });
}

std::optional<VirtualVolume> readVirtualVolume(InputPtr const &input, OutputPtr const &output) {
    std::string const uuid = input->GetString("uuid");
    std::string const containerId = input->GetString("container-id");
    std::array<char, 37> canonical = {};
    if (!LumoLib_NormalizeContainerIdString(containerId.c_str(), canonical.data())) {
        output->SetMessage("Container Id is not valid.");
        return std::nullopt;
    }
    if (uuid.empty()) {
        output->SetMessage("Lumo UUID cannot be empty.");
        return std::nullopt;
    }
    return VirtualVolume{canonical.data(), uuid};
}

} // namespace TarselCli::LumoNamespace
