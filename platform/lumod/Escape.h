// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Lumod {

/// Whether a text is well-formed UTF-8, surrogates excluded.
bool isUtf8(std::string_view text);

/// Whether a text holds a control character of ASCII or of the range that follows it (U+0080 to U+009F).
bool hasControlCharacter(std::string_view text);

/// A text for one line of a log: control characters, invalid UTF-8 and bidirectional controls become \xNN for each of
/// their bytes, and a backslash is doubled, so that the line can be read back without doubt.
std::string escaped(std::string_view text);

/// A sentence that quotes names which users and arrays chose, on one line: breaks and tabs become \n, \r and \t. The
/// rest is left to whoever shows it.
std::string onOneLine(std::string_view text);

/// A text for one JSON string: what is not UTF-8 becomes the replacement character.
std::string repaired(std::string_view text);

} // namespace Lumod
