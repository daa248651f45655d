// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

#include "plexa/Text.h"

namespace Plexa {

/// True for the bytes that stand in a JSON string as they are.
inline bool isPlainInJson(char c) {
    return c >= ' ' && c < '\x7F' && c != '"' && c != '\\';
}

/// Whether a whole text does.
inline bool isPlainInJson(std::string_view text) {
    return isPlainAsciiBut<'"', '\\'>(text);
}

/// The escape of one character that does not stand in a JSON string as it is, or the character.
void appendJsonCharacter(std::string &to, Character const &character);

/// Writes a text as a JSON string, quotes included, to anything that has append(std::string_view): a buffer, a string.
template <typename Out>
void writeJsonText(Out &out, std::string_view text) {
    if constexpr (requires { out.appendQuoted(text); }) {
        if (isPlainInJson(text)) {
            out.appendQuoted(text);
            return;
        }
    }
    out.append(std::string_view("\""));
    while (!text.empty()) {
        std::size_t plain = 0;
        while (plain < text.size() && isPlainInJson(text[plain])) {
            ++plain;
        }
        out.append(text.substr(0, plain));
        text.remove_prefix(plain);
        if (!text.empty()) {
            std::string escape;
            appendJsonCharacter(escape, takeCharacter(text));
            out.append(std::string_view(escape));
        }
    }
    out.append(std::string_view("\""));
}

} // namespace Plexa
