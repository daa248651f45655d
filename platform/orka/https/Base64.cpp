// SPDX-License-Identifier: Apache-2.0
#include "https/Base64.h"

#include <kj/encoding.h>

namespace Orka::Https {

std::string base64Of(std::vector<uint8_t> const &bytes) {
    auto const text = kj::encodeBase64(kj::arrayPtr(bytes.data(), bytes.size()), false);
    return {text.cStr(), text.size()};
}

std::optional<std::vector<uint8_t>> fromBase64(std::string_view text) {
    auto const bytes = kj::decodeBase64(kj::arrayPtr(text.data(), text.size()));
    std::vector<uint8_t> result(bytes.begin(), bytes.end());
    // The library passes over what it does not understand; only what it would have written itself counts.
    if (base64Of(result) != text) {
        return std::nullopt;
    }
    return result;
}

} // namespace Orka::Https
