// SPDX-License-Identifier: Apache-2.0
#include "orka/ProviderFactory.h"

#include <optional>
#include <string_view>

#include "https/HttpsProvider.h"
#include "https/Url.h"
#include "orka/Embedded.h"

namespace Orka {

namespace {

Wire::Failure badUrl(std::string const &url, std::string const &why) {
    return {Wire::ErrorCode::InvalidArgument, "the provider URL '" + url + "' cannot be used: " + why};
}

std::optional<unsigned> hexDigit(char character) {
    if (character >= '0' && character <= '9') {
        return static_cast<unsigned>(character - '0');
    }
    auto const lower = static_cast<char>(character | 0x20);
    if (lower >= 'a' && lower <= 'f') {
        return static_cast<unsigned>(lower - 'a') + 10;
    }
    return std::nullopt;
}

/// "%2f" and the like; a "%" that begins nothing of the kind stands for itself, as do all other characters.
std::string percentDecoded(std::string_view text) {
    std::string result;
    for (size_t index = 0; index < text.size(); ++index) {
        if (text[index] == '%' && index + 2 < text.size()) {
            auto const high = hexDigit(text[index + 1]);
            auto const low = hexDigit(text[index + 2]);
            if (high && low) {
                result += static_cast<char>(*high * 16 + *low);
                index += 2;
                continue;
            }
        }
        result += text[index];
    }
    return result;
}

bool startsWithNoCase(std::string_view text, std::string_view lowerCasePrefix) {
    if (text.size() < lowerCasePrefix.size()) {
        return false;
    }
    for (size_t index = 0; index < lowerCasePrefix.size(); ++index) {
        auto const character = text[index];
        auto const lower = character >= 'A' && character <= 'Z' ? static_cast<char>(character | 0x20) : character;
        if (lower != lowerCasePrefix[index]) {
            return false;
        }
    }
    return true;
}

/// file:///path or file://localhost/path
std::string pathOfFileUrl(std::string const &url) {
    std::string_view rest(url);
    rest.remove_prefix(std::string_view("file://").size());
    if (startsWithNoCase(rest, "localhost/")) {
        rest.remove_prefix(std::string_view("localhost").size());
    }
    if (rest.empty() || rest.front() != '/') {
        throw badUrl(url, "an array file is named by its whole path, as in file:///path/name.array");
    }
    auto path = percentDecoded(rest);
    if (path.find('\0') != std::string::npos) {
        throw badUrl(url, "a path cannot hold the character NUL");
    }
    return path;
}

} // namespace

std::unique_ptr<Provider> makeProvider(std::string const &url, ProviderSurroundings const &surroundings) {
    if (startsWithNoCase(url, "file://")) {
        return std::make_unique<EmbeddedProvider>(pathOfFileUrl(url), surroundings);
    }
    if (surroundings.network != nullptr && startsWithNoCase(url, "https://")) {
        return std::make_unique<Https::HttpsProvider>(Https::parseUrl(url), surroundings);
    }
    throw badUrl(url, surroundings.network == nullptr
                          ? "providers are reached by file:///path/name.array"
                          : "providers are reached by file:///path/name.array or https://host:port/path");
}

} // namespace Orka
