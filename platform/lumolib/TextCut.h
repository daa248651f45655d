// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstring>

namespace LumoClient {

/// Copies a text into a buffer, cut before the character that does not fit whole (UTF-8), and terminated.
/// @param text null counts as empty
inline void copyCut(char *buffer, std::size_t bufferBytes, char const *text) {
    std::size_t length = text != nullptr ? strnlen(text, bufferBytes) : 0;
    if (length == bufferBytes) {
        --length;
        std::size_t cut = length;
        while (cut > 0 && length - cut < 3 && (static_cast<unsigned char>(text[cut]) & 0xC0) == 0x80) {
            --cut;
        }
        // What is no UTF-8 is cut where the room ends.
        length = (static_cast<unsigned char>(text[cut]) & 0xC0) == 0x80 ? length : cut;
    }
    if (length > 0) {
        std::memmove(buffer, text, length);
    }
    buffer[length] = '\0';
}

} // namespace LumoClient
