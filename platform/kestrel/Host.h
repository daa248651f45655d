// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <memory>

#include "ContainerCheck.h"
#include "Places.h"
#include "lumolib/Client.h"
#include "store/HostStore.h"

namespace Kestrel {

/// What one storage interface object and the file systems that it handed out work on. Each part opens itself when it is
/// first used, so that making one costs nothing.
struct Host {
    explicit Host(LumoClient::Settings const &settings);

    /// Of the host whose root the environment names.
    static std::shared_ptr<Host> ofEnvironment();

    Store::HostStore store;
    LumoClient::Client client;
    ContainerCheck containerCheck;
    Places places;
    /// How long to wait for another process that is mounting or unmounting.
    std::chrono::milliseconds lockTimeout{5000};
};

} // namespace Kestrel
