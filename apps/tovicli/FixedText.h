// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <string_view>

namespace Tovicli {

/// A text in fixed room, for signal handlers: nothing is allocated, what does not fit is left out.
class FixedText {
public:
    FixedText &operator<<(std::string_view text) {
        std::size_t const taken = std::min(text.size(), room_.size() - size_);
        std::copy_n(text.begin(), taken, room_.begin() + size_);
        size_ += taken;
        return *this;
    }
    FixedText &operator<<(std::uint64_t number) {
        std::array<char, 20> digits{};
        std::size_t first = digits.size();
        do {
            digits[--first] = static_cast<char>('0' + number % 10);
            number /= 10;
        } while (number != 0);
        return *this << std::string_view(digits.data() + first, digits.size() - first);
    }
    void cut(std::size_t size) {
        size_ = std::min(size_, size);
    }
    std::string_view text() const {
        return {room_.data(), size_};
    }

private:
    std::array<char, 512> room_{};
    std::size_t size_ = 0;
};

} // namespace Tovicli
