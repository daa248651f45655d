// SPDX-License-Identifier: Apache-2.0
#include "Environment.h"

#include <cstdlib>

namespace Tovicli {

std::optional<std::string> ProcessEnvironment::get(std::string const &name) const {
    char const *value = std::getenv(name.c_str());
    return value != nullptr ? std::optional<std::string>(value) : std::nullopt;
}

void ProcessEnvironment::set(std::string const &name, std::string const &value) {
    setenv(name.c_str(), value.c_str(), 1);
}

void ProcessEnvironment::unset(std::string const &name) {
    unsetenv(name.c_str());
}

} // namespace Tovicli
