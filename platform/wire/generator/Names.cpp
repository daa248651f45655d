// SPDX-License-Identifier: Apache-2.0
#include "Names.h"

#include <cctype>

namespace CompactGenerator {

namespace {

bool isUpper(char letter) {
    return std::isupper(static_cast<unsigned char>(letter)) != 0;
}

char toUpper(char letter) {
    return static_cast<char>(std::toupper(static_cast<unsigned char>(letter)));
}

} // namespace

std::string capitalized(std::string name) {
    if (!name.empty()) {
        name[0] = toUpper(name[0]);
    }
    return name;
}

std::string enumerator(std::string const &name) {
    std::string result;
    for (char const letter : name) {
        if (isUpper(letter)) {
            result += '_';
        }
        result += toUpper(letter);
    }
    return result;
}

std::string scopedName(std::string const &displayName) {
    std::string result;
    for (char const letter : displayName.substr(displayName.find(':') + 1)) {
        result += letter == '.' ? std::string("::") : std::string(1, letter);
    }
    return result;
}

std::string ownName(std::string const &scopedName) {
    std::size_t const colons = scopedName.rfind("::");
    return colons == std::string::npos ? scopedName : scopedName.substr(colons + 2);
}

} // namespace CompactGenerator
