// SPDX-License-Identifier: Apache-2.0
#include "Escape.h"

#include <cstddef>
#include <cstdint>

#include <fmt/format.h>

namespace Lumod {

namespace {

struct Character {
    std::size_t bytes = 1; ///< what it takes in the text; 1 for a byte that begins nothing valid
    char32_t codePoint = 0;
    bool valid = false;
};

/// The character that a text, which is not empty, begins with.
Character firstOf(std::string_view text) {
    auto const byte = [&text](std::size_t place) { return static_cast<uint8_t>(text[place]); };
    uint8_t const lead = byte(0);
    if (lead < 0x80) {
        return {1, lead, true};
    }
    std::size_t const bytes = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (lead < 0xC2 || lead > 0xF4 || text.size() < bytes) {
        return {};
    }
    char32_t codePoint = lead & (0x7Fu >> bytes);
    for (std::size_t place = 1; place < bytes; ++place) {
        if ((byte(place) & 0xC0) != 0x80) {
            return {};
        }
        codePoint = (codePoint << 6) | (byte(place) & 0x3Fu);
    }
    bool const overlong = (bytes == 3 && codePoint < 0x800) || (bytes == 4 && codePoint < 0x10000);
    bool const surrogate = codePoint >= 0xD800 && codePoint <= 0xDFFF;
    if (overlong || surrogate || codePoint > 0x10FFFF) {
        return {};
    }
    return {bytes, codePoint, true};
}

bool isControl(char32_t c) {
    return c < 0x20 || (c >= 0x7F && c < 0xA0);
}

bool isBidirectional(char32_t c) {
    return c == 0x061C || c == 0x200E || c == 0x200F || (c >= 0x202A && c <= 0x202E) || (c >= 0x2066 && c <= 0x2069) ||
           c == 0x2028 || c == 0x2029;
}

} // namespace

bool isUtf8(std::string_view text) {
    while (!text.empty()) {
        Character const character = firstOf(text);
        if (!character.valid) {
            return false;
        }
        text.remove_prefix(character.bytes);
    }
    return true;
}

bool hasControlCharacter(std::string_view text) {
    while (!text.empty()) {
        Character const character = firstOf(text);
        if (character.valid && isControl(character.codePoint)) {
            return true;
        }
        text.remove_prefix(character.bytes);
    }
    return false;
}

std::string escaped(std::string_view text) {
    std::string result;
    result.reserve(text.size());
    while (!text.empty()) {
        Character const character = firstOf(text);
        std::string_view const bytes = text.substr(0, character.bytes);
        if (character.codePoint == '\\') {
            result += "\\\\";
        } else if (character.valid && !isControl(character.codePoint) && !isBidirectional(character.codePoint)) {
            result += bytes;
        } else {
            for (char const byte : bytes) {
                result += fmt::format("\\x{:02X}", static_cast<uint8_t>(byte));
            }
        }
        text.remove_prefix(character.bytes);
    }
    return result;
}

std::string onOneLine(std::string_view text) {
    std::string line;
    line.reserve(text.size());
    for (char const character : text) {
        switch (character) {
        case '\n':
            line += "\\n";
            break;
        case '\r':
            line += "\\r";
            break;
        case '\t':
            line += "\\t";
            break;
        default:
            line += character;
        }
    }
    return line;
}

std::string repaired(std::string_view text) {
    std::string result;
    result.reserve(text.size());
    while (!text.empty()) {
        Character const character = firstOf(text);
        result += character.valid ? text.substr(0, character.bytes) : std::string_view("\xEF\xBF\xBD");
        text.remove_prefix(character.bytes);
    }
    return result;
}

} // namespace Lumod
