// SPDX-License-Identifier: Apache-2.0
//
// The arrays of a provider as the user gives them: the n-th arrayid, the n-th priority and the n-th isactive describe
// the n-th array.
#pragma once

#include <optional>
#include <vector>

#include "CommandFrame.h"
#include "gantry/Storage.h"

namespace TarselCli::LumoNamespace {

/// Reads and pairs the lists. A priority keeps its low 32 bits.
/// @return empty when the lists differ in length; the output then holds the message for it.
std::optional<std::vector<Gantry::Storage::RelatedStorageArrayInfo>> readProviderArrays(InputPtr const &input,
                                                                                        OutputPtr const &output);

/// @return a record without auxiliary text.
Gantry::Storage::VendorProviderInfo makeProvider(std::string const &name, std::string const &url,
                                                 std::vector<Gantry::Storage::RelatedStorageArrayInfo> const &arrays);

} // namespace TarselCli::LumoNamespace
