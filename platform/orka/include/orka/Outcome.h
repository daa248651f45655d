// SPDX-License-Identifier: Apache-2.0
//
// A value or the Wire::Failure that stands in its place. A promise of ours carries an Outcome and is never rejected for
// a cause that a user should read: an exception that passes through a KJ promise arrives as a kj::Exception, without
// the code that programs decide by. What does reject a promise is a defect, or a fault of the machine, and may be
// reported as an internal error.
#pragma once

#include <type_traits>
#include <utility>
#include <variant>

#include "wire/Failure.h"

namespace Orka {

/// What an operation without an answer of its own gives.
using Done = std::monostate;

template <typename T>
class [[nodiscard]] Outcome {
    static_assert(!std::is_same_v<T, Wire::Failure>);

public:
    using Value = T;

    // Implicit, so that a function can return either.
    Outcome(T value)
        : content_(std::in_place_index<0>, std::move(value)) {}
    Outcome(Wire::Failure failure)
        : content_(std::in_place_index<1>, std::move(failure)) {}

    bool ok() const noexcept {
        return content_.index() == 0;
    }
    explicit operator bool() const noexcept {
        return ok();
    }

    /// The value; throws the failure when there is none.
    T const &value() const & {
        throwFailure();
        return std::get<0>(content_);
    }
    T &&value() && {
        throwFailure();
        return std::get<0>(std::move(content_));
    }

    /// The failure; only when ok() is false.
    Wire::Failure const &failure() const & {
        return std::get<1>(content_);
    }

private:
    void throwFailure() const {
        if (!ok()) {
            throw std::get<1>(content_);
        }
    }

    std::variant<T, Wire::Failure> content_;
};

/// Runs a function that throws Wire::Failure and returns what came of it.
template <typename Function>
auto outcomeOf(Function &&function) -> Outcome<std::decay_t<decltype(function())>> {
    try {
        return function();
    } catch (Wire::Failure const &failure) {
        return failure;
    }
}

} // namespace Orka
