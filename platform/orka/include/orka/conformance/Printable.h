// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Orka::Conformance {

/// A text of anybody's as a terminal may show it and a document may hold it: visible characters of valid UTF-8 as they
/// are, every other byte, and the backslash, as \xNN.
std::string printable(std::string_view text);

} // namespace Orka::Conformance
