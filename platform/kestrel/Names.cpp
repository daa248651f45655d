// SPDX-License-Identifier: Apache-2.0
#include "Names.h"

#include <string_view>

#include <boost/locale/utf.hpp>

#include "wire/ContainerId.h"
#include "wire/Failure.h"

namespace Kestrel {
namespace {

constexpr std::size_t nameBytesMax = 255; // NAME_MAX of every file system that a root may lie on

[[noreturn]] void refuse(std::string const &name, std::string const &what, std::string const &reason) {
    throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "the " + what + " '" + name + "' " + reason);
}

bool isControl(boost::locale::utf::code_point point) {
    return point < 0x20 || (point >= 0x7f && point < 0xa0);
}

/// A name for a sentence: line ends and other control characters of one byte become \xNN.
std::string inOneLine(std::string const &name) {
    constexpr std::string_view digits = "0123456789abcdef";
    std::string shown;
    for (char const character : name) {
        auto const byte = static_cast<unsigned char>(character);
        if (byte >= 0x20 && byte != 0x7f) {
            shown += character;
        } else {
            shown += {'\\', 'x', digits[byte >> 4U], digits[byte & 0xfU]};
        }
    }
    return shown;
}

void requirePrintableUtf8(std::string const &name, std::string const &what) {
    for (auto next = name.begin(); next != name.end();) {
        auto const point = boost::locale::utf::utf_traits<char>::decode(next, name.end());
        if (!boost::locale::utf::is_valid_codepoint(point)) {
            refuse(name, what, "is not valid UTF-8");
        }
        if (isControl(point)) {
            refuse(inOneLine(name), what, "has a control character in it");
        }
    }
}

} // namespace

void requireDirectoryName(std::string const &name, std::string const &what) {
    if (name.empty()) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "the " + what + " is empty");
    }
    if (auto const nul = name.find('\0'); nul != std::string::npos) {
        refuse(name.substr(0, nul), what, "has a NUL byte behind these characters");
    }
    if (name.size() > nameBytesMax) {
        refuse(name.substr(0, 40) + "...", what,
               "is longer than " + std::to_string(nameBytesMax) + " bytes (" + std::to_string(name.size()) + ")");
    }
    if (name == "." || name == "..") {
        refuse(name, what, "cannot name a directory");
    }
    if (name.find('/') != std::string::npos) {
        refuse(name, what, "has a '/' in it: it must be a single directory name, not a path");
    }
    requirePrintableUtf8(name, what);
}

void requireContainerName(std::string const &name) {
    requireDirectoryName(name, "storage container name");
    if (name.front() == '.') {
        refuse(name, "storage container name", "begins with '.': its directory would be hidden");
    }
}

std::string requireContainerId(std::string const &text) {
    auto canonical = Wire::normalizeContainerId(text);
    if (!canonical) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            "'" + text + "' is no storage container id: a UUID of 32 hexadecimal digits is expected");
    }
    return *canonical;
}

std::string requireVolumeUuid(std::string const &text) {
    if (auto canonical = Wire::normalizeContainerId(text)) {
        return *canonical;
    }
    requireDirectoryName(text, "volume uuid");
    return text;
}

} // namespace Kestrel
