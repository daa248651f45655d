// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <kj/exception.h>

namespace Orka {

/// What the system said when a network operation failed, as "Connection refused", without the calls and values that the
/// library puts around it.
std::string systemReason(kj::Exception const &exception);

} // namespace Orka
