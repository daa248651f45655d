// SPDX-License-Identifier: Apache-2.0
//
// The exception for a daemon session that cannot be opened. Header-only, and unrelated to GantryException: a handler
// for one does not catch the other.
#pragma once

#include <exception>
#include <string>
#include <utility>

#include "gantry/Lib.h"

// Everything is built with hidden visibility; what crosses the boundary of libkestrel carries this mark.
#define KESTREL_EXPORT __attribute__((visibility("default")))

namespace Kestrel::Lib {

/// Carries the place in the source that could not go on, besides the message.
class KESTREL_EXPORT KestrelException : public std::exception {
public:
    KestrelException(std::string message, std::string file, unsigned line, Gantry::Lib::QuibMessage quib)
        : message_(std::move(message))
        , file_(std::move(file))
        , line_(line)
        , quib_(quib) {}
    std::string GetMessage() const {
        return message_;
    }
    std::string GetFile() const {
        return file_;
    }
    unsigned GetLine() const {
        return line_;
    }
    Gantry::Lib::QuibMessage const &GetQuibMessage() const {
        return quib_;
    }
    char const *what() const noexcept override {
        return message_.c_str();
    }

private:
    std::string message_;
    std::string file_;
    unsigned line_;
    [[no_unique_address]] Gantry::Lib::QuibMessage quib_;
};

} // namespace Kestrel::Lib
