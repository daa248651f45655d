// SPDX-License-Identifier: Apache-2.0
//
// What a fuzz target holds the code to, beside that it neither crashes nor hangs. A property that is broken ends the
// process, so that the fuzzer keeps the input.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "wire/Failure.h"

namespace Fuzz {

/// Tells which property is broken, on standard error, and aborts.
[[noreturn]] void broken(std::string_view property, std::string_view detail);

inline void require(bool holds, std::string_view property, std::string_view detail = {}) {
    if (!holds) {
        broken(property, detail);
    }
}

/// A sentence for a user: there is one, in valid UTF-8, without control characters, so on one line.
void requireSentence(std::string_view sentence);

/// A failure has a code of the table, which is not success, and a sentence as it stands in front of a user, who may
/// have got quoted in it whatever an input holds: it is escaped only where it is shown.
void requireFailure(Wire::Failure const &failure);

/// An input as text.
inline std::string_view textOf(std::uint8_t const *data, std::size_t size) {
    return {reinterpret_cast<char const *>(data), size};
}

} // namespace Fuzz

/// What the fuzzer calls with each input; every target defines it.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size);
