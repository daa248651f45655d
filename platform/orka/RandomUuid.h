// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace Orka {

/// A canonical version 4 UUID from the kernel's random source. @throws Wire::Failure when that has none to give.
std::string randomUuid();

} // namespace Orka
