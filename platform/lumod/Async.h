// SPDX-License-Identifier: Apache-2.0
//
// Chains of promises that carry outcomes. A step takes the value of the one before; a failure skips the steps that
// follow, and a step may throw a Wire::Failure, as it could in plain code. (KJ would turn what a continuation throws
// into an exception of its own, without the code.)
#pragma once

#include <type_traits>
#include <utility>

#include <kj/async.h>

#include "orka/Outcome.h"

namespace Lumod {

using Orka::Done;
using Orka::Outcome;

/// What comes later: a value or a failure.
template <typename T>
using Answer = kj::Promise<Outcome<T>>;

namespace Detail {

/// What a step may return for an Answer<T>: a T, an Outcome<T> or an Answer<T>.
template <typename R>
struct Step {
    using Value = R;
    static Answer<R> answer(R value) {
        return Outcome<R>(std::move(value));
    }
};
template <typename T>
struct Step<Outcome<T>> {
    using Value = T;
    static Answer<T> answer(Outcome<T> outcome) {
        return Answer<T>(std::move(outcome));
    }
};
template <typename T>
struct Step<kj::Promise<Outcome<T>>> {
    using Value = T;
    static Answer<T> answer(Answer<T> promise) {
        return promise;
    }
};

} // namespace Detail

/// Runs a step now.
template <typename Function>
auto attempt(Function &&function) {
    using Step = Detail::Step<std::decay_t<decltype(function())>>;
    using Value = typename Step::Value;
    try {
        return Step::answer(function());
    } catch (Wire::Failure const &failure) {
        return Answer<Value>(Outcome<Value>(failure));
    }
}

/// Runs a step when the answer is there, unless it is a failure.
template <typename T, typename Function>
auto andThen(Answer<T> answer, Function function) {
    using Value = typename Detail::Step<std::decay_t<decltype(function(std::declval<T>()))>>::Value;
    return answer.then([function = std::move(function)](Outcome<T> &&outcome) mutable -> Answer<Value> {
        if (!outcome.ok()) {
            return Outcome<Value>(outcome.failure());
        }
        return attempt([&function, &outcome] { return function(std::move(outcome).value()); });
    });
}

/// Runs a step whatever came of the answer.
template <typename T, typename Function>
auto whateverCame(Answer<T> answer, Function function) {
    using Value = typename Detail::Step<std::decay_t<decltype(function(std::declval<Outcome<T>>()))>>::Value;
    return answer.then([function = std::move(function)](Outcome<T> &&outcome) mutable -> Answer<Value> {
        return attempt([&function, &outcome] { return function(std::move(outcome)); });
    });
}

} // namespace Lumod
