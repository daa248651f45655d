// SPDX-License-Identifier: Apache-2.0
#include "Console.h"

#include <fmt/format.h>

namespace Orkasim {

std::string printable(std::string_view text) {
    std::string result;
    for (auto const character : text) {
        auto const byte = static_cast<unsigned char>(character);
        if (byte < 0x20 || byte == 0x7f) {
            result += fmt::format("\\x{:02x}", byte);
        } else {
            result += character;
        }
    }
    return result;
}

} // namespace Orkasim
