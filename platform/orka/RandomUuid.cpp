// SPDX-License-Identifier: Apache-2.0
#include "RandomUuid.h"

#include <array>
#include <cerrno>
#include <cstdint>
#include <sys/random.h>

#include "wire/Failure.h"

namespace Orka {

std::string randomUuid() {
    std::array<uint8_t, 16> bytes{};
    ssize_t given = 0;
    do {
        // Up to 256 bytes come whole or not at all.
        given = getrandom(bytes.data(), bytes.size(), 0);
    } while (given < 0 && errno == EINTR);
    if (given != static_cast<ssize_t>(bytes.size())) {
        throw Wire::Failure(Wire::ErrorCode::InternalError, "the kernel gave no random bytes for a new volume's id");
    }
    bytes[6] = static_cast<uint8_t>((bytes[6] & 0x0f) | 0x40);
    bytes[8] = static_cast<uint8_t>((bytes[8] & 0x3f) | 0x80);

    constexpr char const *digits = "0123456789abcdef";
    std::string text;
    text.reserve(36);
    for (size_t index = 0; index < bytes.size(); ++index) {
        if (index == 4 || index == 6 || index == 8 || index == 10) {
            text += '-';
        }
        text += digits[bytes[index] >> 4];
        text += digits[bytes[index] & 0x0f];
    }
    return text;
}

} // namespace Orka
