// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <string>

#include <kj/async-io.h>
#include <kj/timer.h>

#include "orka/Provider.h"

namespace Orka {

/// What every provider is made with. Timer and network are the caller's and outlive the providers and their promises.
struct ProviderSurroundings {
    kj::Timer &timer;
    std::function<std::string()> newUuid; ///< canonical ids for new volumes; null: random ones
    kj::Network *network = nullptr;       ///< for https://; null: providers that are servers are refused
    std::string certificates{};           ///< directory of pinned certificates, HOST_PORT.pem; empty: none are pinned
};

/// Makes the provider that a URL names: file:///path/name.array or https://host:port/path. Nothing is opened or
/// connected before the first operation.
/// @throws Wire::Failure InvalidArgument for a URL of no scheme that is supported, or one that is not well-formed.
std::unique_ptr<Provider> makeProvider(std::string const &url, ProviderSurroundings const &surroundings);

} // namespace Orka
