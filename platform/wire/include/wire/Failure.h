// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <string>
#include <utility>

#include "wire/ErrorCode.h"

namespace Wire {

/// Thrown where a cause is known: a code for programs and a finished sentence for the user, with the particulars
/// (which path, which name). Caught once, at the edge that answers a caller.
class __attribute__((visibility("default"))) Failure : public std::exception {
public:
    Failure(ErrorCode code, std::string sentence)
        : code_(code)
        , sentence_(std::move(sentence)) {}
    ErrorCode code() const noexcept {
        return code_;
    }
    std::string const &sentence() const noexcept {
        return sentence_;
    }
    char const *what() const noexcept override {
        return sentence_.c_str();
    }

private:
    ErrorCode code_;
    std::string sentence_;
};

} // namespace Wire
