// SPDX-License-Identifier: Apache-2.0
#include "Host.h"

#include "wire/Paths.h"

namespace Kestrel {

Host::Host(LumoClient::Settings const &settings)
    : store(settings.root, Store::HostStore::Mode::ReadWrite)
    , client(settings)
    , containerCheck(client)
    , places(Wire::Paths(settings.root).root()) {}

std::shared_ptr<Host> Host::ofEnvironment() {
    return std::make_shared<Host>(LumoClient::Settings::fromEnvironment());
}

} // namespace Kestrel
