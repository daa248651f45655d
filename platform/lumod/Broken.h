// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <fmt/format.h>
#include <kj/exception.h>

#include "wire/Failure.h"

namespace Lumod {

/// A defect, or a fault of the machine, told as what it is.
/// @param what what broke, as the beginning of a sentence
inline Wire::Failure brokenBy(kj::Exception const &exception, std::string const &what) {
    if (exception.getType() == kj::Exception::Type::OVERLOADED) { // what KJ makes of std::bad_alloc
        return Wire::Failure(Wire::ErrorCode::OutOfMemory, what + ": the daemon is out of memory");
    }
    return Wire::Failure(Wire::ErrorCode::InternalError,
                         fmt::format("{}: {}", what, exception.getDescription().cStr()));
}

} // namespace Lumod
