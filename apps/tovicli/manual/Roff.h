// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Tovicli::Manual {

/// A text that shows as it is: whatever roff would take for a request, an escape or a typographic character is not.
std::string roff(std::string_view text);

/// The same in bold or italics.
std::string bold(std::string_view text);
std::string italic(std::string_view text);

/// A page's head.
/// @param name as it is called, "tovicli"
std::string pageHead(std::string_view name, int section, std::string_view version);

/// A section's heading, or the label of a paragraph that hangs below it.
std::string section(std::string_view title);
std::string label(std::string const &formatted);

/// Lines that stay as they are.
std::string verbatim(std::string_view text);

} // namespace Tovicli::Manual
