// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <string>
#include <utility>

namespace Plexa {

/// What went wrong, in a sentence that is ready to be shown: what came from outside is escaped in it.
class SentenceError : public std::exception {
public:
    explicit SentenceError(std::string sentence)
        : sentence_(std::move(sentence)) {}
    std::string const &sentence() const noexcept {
        return sentence_;
    }
    char const *what() const noexcept override {
        return sentence_.c_str();
    }

private:
    std::string sentence_;
};

} // namespace Plexa
