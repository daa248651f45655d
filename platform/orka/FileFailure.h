// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utility>

#include "sqlite/Error.h"
#include "wire/Failure.h"

namespace Orka {

/// What the ground floor reports, as our users are told it.
Wire::Failure failureOf(Sqlite::Error const &error);

/// Runs a function on the file and turns what the ground floor throws into Wire::Failure.
template <typename Function>
auto onFile(Function &&function) -> decltype(function()) {
    try {
        return std::forward<Function>(function)();
    } catch (Sqlite::Error const &error) {
        throw failureOf(error);
    }
}

} // namespace Orka
