// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <new>
#include <string>

namespace Tovicli {

/// What an exception says, for a user.
inline std::string textOf(std::exception const &failure) {
    return dynamic_cast<std::bad_alloc const *>(&failure) != nullptr ? "out of memory" : failure.what();
}

} // namespace Tovicli
