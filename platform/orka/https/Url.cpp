// SPDX-License-Identifier: Apache-2.0
#include "https/Url.h"

#include <algorithm>
#include <charconv>
#include <string_view>

#include "wire/Failure.h"

namespace Orka::Https {

namespace {

constexpr std::string_view scheme = "https://";

[[noreturn]] void refuse(std::string const &url, char const *why) {
    throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "the provider URL '" + url + "' cannot be used: " + why);
}

bool isHostCharacter(char character) {
    return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
           (character >= '0' && character <= '9') || character == '-' || character == '.' || character == '_';
}

bool isAddressCharacter(char character) {
    return (character >= 'a' && character <= 'f') || (character >= 'A' && character <= 'F') ||
           (character >= '0' && character <= '9') || character == ':' || character == '.';
}

bool isPathCharacter(char character) {
    // What may stand in a request line as it is.
    return character > ' ' && character < 0x7f && character != '"' && character != '<' && character != '>' &&
           character != '\\' && character != '^' && character != '`' && character != '{' && character != '|' &&
           character != '}';
}

} // namespace

std::string Url::authority() const {
    bool const bracketed = host.find(':') != std::string::npos;
    return (bracketed ? '[' + host + ']' : host) + ':' + std::to_string(port);
}

Url parseUrl(std::string const &text) {
    std::string_view rest(text);
    rest.remove_prefix(std::min(scheme.size(), rest.size()));
    auto const slash = rest.find_first_of("/?#");
    std::string_view authority = rest.substr(0, slash);
    std::string_view path = slash == std::string_view::npos ? std::string_view() : rest.substr(slash);
    if (path.find_first_of("?#") != std::string_view::npos) {
        refuse(text, "it may hold neither '?' nor '#'");
    }
    if (authority.find('@') != std::string_view::npos) {
        refuse(text, "it may not name a user");
    }
    Url url;
    if (!authority.empty() && authority.front() == '[') {
        auto const end = authority.find(']');
        if (end == std::string_view::npos) {
            refuse(text, "the ']' that ends its address is missing");
        }
        url.host = authority.substr(1, end - 1);
        authority.remove_prefix(end + 1);
        if (!std::all_of(url.host.begin(), url.host.end(), isAddressCharacter)) {
            refuse(text, "between its brackets stands no address");
        }
    } else {
        auto const colon = authority.find(':');
        url.host = authority.substr(0, colon);
        authority.remove_prefix(std::min(colon, authority.size()));
        if (!std::all_of(url.host.begin(), url.host.end(), isHostCharacter)) {
            refuse(text, "its host is no name and no address");
        }
        if (url.host == "unix" || url.host == "unix-abstract") {
            // The library would take it, with the port, for the path of a socket of this machine.
            refuse(text, "its host cannot be told from a local socket; name it with its domain");
        }
    }
    if (url.host.empty()) {
        refuse(text, "it names no host, as https://host:port/path does");
    }
    if (!authority.empty()) {
        auto const *const begin = authority.data() + 1;
        auto const *const end = authority.data() + authority.size();
        auto const read = std::from_chars(begin, end, url.port);
        if (authority.front() != ':' || read.ec != std::errc() || read.ptr != end || url.port == 0) {
            refuse(text, "its port is no number from 1 to 65535");
        }
    }
    if (!std::all_of(path.begin(), path.end(), isPathCharacter)) {
        refuse(text, "its path holds a character that has to be written as %XX");
    }
    while (!path.empty() && path.back() == '/') {
        path.remove_suffix(1);
    }
    url.path = path;
    return url;
}

} // namespace Orka::Https
