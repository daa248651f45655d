// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace Wire {

/// Length of a canonical container id in characters.
inline constexpr std::size_t containerIdLength = 36;

/// The canonical form of a container id: a UUID of 36 characters in lower case.
/// Accepted spellings are letters in any case, the hyphens left out (all four), and braces around the whole.
/// @return nullopt for anything else
std::optional<std::string> normalizeContainerId(std::string_view text);

} // namespace Wire
