// SPDX-License-Identifier: Apache-2.0
#include "wire/ContainerId.h"

namespace Wire {

namespace {

constexpr std::size_t digitCount = 32;

bool hyphenStandsBefore(std::size_t digit) {
    return digit == 8 || digit == 12 || digit == 16 || digit == 20;
}

/// @return the digit in lower case, 0 when it is none
char lowerHexDigit(char c) {
    if ((c >= '0' && c <= '9') || (c >= 'a' && c <= 'f')) {
        return c;
    }
    if (c >= 'A' && c <= 'F') {
        return static_cast<char>(c - 'A' + 'a');
    }
    return 0;
}

} // namespace

std::optional<std::string> normalizeContainerId(std::string_view text) {
    if (text.size() >= 2 && text.front() == '{' && text.back() == '}') {
        text = text.substr(1, text.size() - 2);
    }
    bool const hyphens = text.size() == containerIdLength;
    if (!hyphens && text.size() != digitCount) {
        return std::nullopt;
    }
    std::string canonical;
    canonical.reserve(containerIdLength);
    std::size_t next = 0;
    for (std::size_t digit = 0; digit < digitCount; ++digit) {
        if (hyphenStandsBefore(digit)) {
            if (hyphens && text[next++] != '-') {
                return std::nullopt;
            }
            canonical += '-';
        }
        char const lower = lowerHexDigit(text[next++]);
        if (lower == 0) {
            return std::nullopt;
        }
        canonical += lower;
    }
    return canonical;
}

} // namespace Wire
