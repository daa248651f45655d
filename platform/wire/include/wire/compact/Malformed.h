// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>

namespace Wire::Compact {

/// Thrown where a received message contradicts itself, points outside of itself, nests too deeply or has its words
/// visited too often. What was read before stays as it was; nothing more of the message is of use.
class Malformed : public std::exception {
public:
    /// @param what a text that lives on, for logs and debuggers; it speaks of the encoding and is not for users
    explicit Malformed(char const *what) noexcept
        : what_(what) {}
    char const *what() const noexcept override {
        return what_;
    }

private:
    char const *what_;
};

/// Out of line, so that the readers' inline code holds calls and no throwing.
[[noreturn]] void malformed(char const *what);

} // namespace Wire::Compact
