// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace Orka::Https {

std::string base64Of(std::vector<uint8_t> const &bytes);
/// Nothing when the text is not base64 to the letter: the standard alphabet, padded, on one line.
std::optional<std::vector<uint8_t>> fromBase64(std::string_view text);

} // namespace Orka::Https
