// SPDX-License-Identifier: Apache-2.0
//
// How the host's storage configuration reports failure. Header-only: a handler needs no library to catch it.
#pragma once

#include <exception>
#include <string>
#include <utility>

// Exceptions and polymorphic interfaces carry this mark, so that every library that throws, catches or derives from one
// of them agrees on its type.
#define GANTRY_EXPORT __attribute__((visibility("default")))

namespace Gantry::Lib {

/// The observation message that an exception carries. Nothing on this host fills one yet.
class QuibMessage {};

/// A failed operation of the host's storage configuration. The message is a finished text for the user.
class GANTRY_EXPORT GantryException : public std::exception {
public:
    GantryException(std::string message, QuibMessage quib)
        : message_(std::move(message))
        , quib_(quib) {}
    std::string GetMessage() const {
        return message_;
    }
    QuibMessage const &GetQuibMessage() const {
        return quib_;
    }
    char const *what() const noexcept override {
        return message_.c_str();
    }

private:
    std::string message_;
    [[no_unique_address]] QuibMessage quib_;
};

} // namespace Gantry::Lib
