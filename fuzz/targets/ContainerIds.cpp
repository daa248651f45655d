// SPDX-License-Identifier: Apache-2.0
//
// Spellings of container ids, as commands, clients and providers give them.
#include <algorithm>
#include <array>
#include <cctype>
#include <string>

#include "Property.h"
#include "lumolib/LumoLib.h"
#include "wire/ContainerId.h"

namespace {

using Fuzz::require;

/// Digits alone, in lower case: what a spelling says, whichever it is.
std::string digitsOf(std::string_view text) {
    std::string digits;
    for (char const c : text) {
        if (std::isxdigit(static_cast<unsigned char>(c)) != 0) {
            digits += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        }
    }
    return digits;
}

void checkCanonical(std::string const &canonical, std::string_view text) {
    require(canonical.size() == Wire::containerIdLength, "a canonical id has 36 characters", canonical);
    for (std::size_t place = 0; place < canonical.size(); ++place) {
        bool const isHyphen = place == 8 || place == 13 || place == 18 || place == 23;
        char const c = canonical[place];
        require(isHyphen ? c == '-' : (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f'),
                "a canonical id is hexadecimal digits in groups", canonical);
    }
    require(digitsOf(canonical) == digitsOf(text), "a canonical id has the digits of the text", canonical);
    require(text.find_first_not_of("0123456789abcdefABCDEF-{}") == std::string_view::npos,
            "what is accepted holds nothing else than digits, hyphens and braces", text);
}

void checkSpellings(std::string const &canonical) {
    std::string upper = canonical;
    std::transform(upper.begin(), upper.end(), upper.begin(),
                   [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    std::string const bare = digitsOf(canonical);
    for (std::string const &spelling : {canonical, upper, bare, "{" + canonical + "}", "{" + bare + "}"}) {
        require(Wire::normalizeContainerId(spelling) == canonical, "every spelling means the same", spelling);
    }
    require(!Wire::normalizeContainerId(canonical + "0"), "an id has no appendix", canonical);
    require(!Wire::normalizeContainerId("{" + canonical), "braces come in pairs", canonical);
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    std::string_view const text = Fuzz::textOf(data, size);
    std::optional<std::string> const canonical = Wire::normalizeContainerId(text);
    if (canonical) {
        checkCanonical(*canonical, text);
        checkSpellings(*canonical);
    }
    // The C function sees the text up to its NUL.
    std::string const terminated(text.substr(0, text.find('\0')));
    std::array<char, Wire::containerIdLength + 1> buffer{};
    bool const accepted = LumoLib_NormalizeContainerIdString(terminated.c_str(), buffer.data());
    std::optional<std::string> const expected = Wire::normalizeContainerId(terminated);
    require(accepted == expected.has_value(), "the C function accepts the same", terminated);
    require(buffer.data() == expected.value_or(""), "the C function gives the same", buffer.data());
    return 0;
}
