// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "store/HostStore.h"

namespace Fuzz {

inline constexpr char const *sampleContainer = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
inline constexpr char const *sampleVolume = "11111111-2222-3333-4444-555555555555";

/// Makes a host store with something of everything.
/// @return its path
inline std::string makeSampleStore(std::string const &root) {
    Store::HostStore store(root, Store::HostStore::Mode::ReadWrite);
    store.putProviders({{"provider", "file:///a.array", "text", {{"array", true, 1}, {"other", false, -1}}}});
    store.addFileSystem({"gold", sampleContainer, {"array"}});
    store.putVolumes({{sampleVolume, sampleContainer, "directory", Store::VolumeState::Mounted},
                      {"22222222-2222-3333-4444-555555555555", sampleContainer, "away", Store::VolumeState::Unmounted}},
                     {});
    store.setEndpointOutage("endpoint", true);
    store.setOrkaContext("context");
    return store.path();
}

} // namespace Fuzz
