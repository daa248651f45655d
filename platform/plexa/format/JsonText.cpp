// SPDX-License-Identifier: Apache-2.0
#include "plexa/JsonText.h"

#include <fmt/format.h>

#include "plexa/Text.h"

namespace Plexa {

namespace {

void appendUnit(std::string &to, unsigned unit) {
    fmt::format_to(std::back_inserter(to), "\\u{:04x}", unit);
}

void appendCharacter(std::string &to, Character const &character) {
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

} // namespace

// RapidJSON's writer either trusts its input to be UTF-8 or, told to check, stops in the middle of the document.
std::string jsonText(std::string_view text) {
    std::string json = "\"";
    json.reserve(text.size() + 2);
    while (!text.empty()) {
        char const front = text.front();
        if (front >= ' ' && front < '\x7F' && front != '"' && front != '\\') {
            json += front;
            text.remove_prefix(1);
        } else {
            appendCharacter(json, takeCharacter(text));
        }
    }
    json += '"';
    return json;
}

} // namespace Plexa
