// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "sqlite/Error.h"
#include "wire/Failure.h"

namespace Store {

Wire::Failure toFailure(Sqlite::Error const &error);

/// Runs an operation of the store; what the database throws leaves as a Wire::Failure.
template <typename Operation>
auto translated(Operation const &operation) {
    try {
        return operation();
    } catch (Sqlite::Error const &error) {
        throw toFailure(error);
    }
}

} // namespace Store
