// SPDX-License-Identifier: Apache-2.0
//
// What a double answers: a queue of answers for the next calls, and a standing one for all others. A double never
// makes an answer up; it gives what the test put here.
#pragma once

#include <deque>
#include <functional>
#include <stdexcept>
#include <string>
#include <utility>

#include "gantry/Lib.h"

namespace Doubles {

/// The answer of an operation that returns nothing.
struct Done {};

/// An exception of a kind that no command expects.
class Unexpected : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

inline Gantry::Lib::GantryException gantryFailure(std::string const &message) {
    return {message, Gantry::Lib::QuibMessage()};
}

template <class T>
class Answers {
public:
    explicit Answers(T standing = T()) {
        always(std::move(standing));
    }

    /// For one call, behind what is queued already.
    Answers &once(T value) {
        queue_.push_back(giving(std::move(value)));
        return *this;
    }
    template <class Exception>
    Answers &throwOnce(Exception exception) {
        queue_.push_back(throwing(std::move(exception)));
        return *this;
    }
    /// For every call that finds the queue empty.
    Answers &always(T value) {
        standing_ = giving(std::move(value));
        return *this;
    }
    template <class Exception>
    Answers &throwAlways(Exception exception) {
        standing_ = throwing(std::move(exception));
        return *this;
    }

    /// The answer to the call that is being made.
    T next() {
        if (queue_.empty()) {
            return standing_();
        }
        std::function<T()> const answer = std::move(queue_.front());
        queue_.pop_front();
        return answer();
    }

private:
    static std::function<T()> giving(T value) {
        return [value = std::move(value)] { return value; };
    }
    template <class Exception>
    static std::function<T()> throwing(Exception exception) {
        return [exception = std::move(exception)]() -> T { throw exception; };
    }

    std::deque<std::function<T()>> queue_;
    std::function<T()> standing_;
};

} // namespace Doubles
