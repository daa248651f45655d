// SPDX-License-Identifier: Apache-2.0
#include "plexa/JsonText.h"

#include <fmt/format.h>

#include "JsonEscapes.h"

namespace Plexa {

namespace {

void appendUnit(std::string &to, unsigned unit) {
    fmt::format_to(std::back_inserter(to), "\\u{:04x}", unit);
}

} // namespace

void appendJsonCharacter(std::string &to, Character const &character) {
    if (!character.valid) {
        fmt::format_to(std::back_inserter(to), "\\\\x{:02x}", static_cast<unsigned char>(character.bytes.front()));
    } else if (character.code == U'"' || character.code == U'\\') {
        to += '\\';
        to += character.bytes;
    } else if (character.code == U'\n') {
        to += "\\n";
    } else if (!isUnsafeCharacter(character.code)) {
        to += character.bytes;
    } else if (character.code < 0x10000) {
        appendUnit(to, static_cast<unsigned>(character.code));
    } else {
        unsigned const offset = static_cast<unsigned>(character.code) - 0x10000;
        appendUnit(to, 0xD800 + (offset >> 10));
        appendUnit(to, 0xDC00 + (offset & 0x3FF));
    }
}

std::string jsonText(std::string_view text) {
    std::string json;
    json.reserve(text.size() + 2);
    writeJsonText(json, text);
    return json;
}

} // namespace Plexa
