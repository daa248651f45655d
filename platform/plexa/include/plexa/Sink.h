// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Plexa {

/// Where text goes: a terminal, a file, a pipe, a test's string.
class Sink {
public:
    virtual ~Sink() = default;
    /// Takes the text as it is. A sink that cannot says so later, in its own way; writing on is harmless.
    virtual void write(std::string_view text) = 0;
};

/// Keeps what is written: the twin for tests.
class StringSink : public Sink {
public:
    void write(std::string_view text) override {
        text_ += text;
    }
    std::string const &text() const {
        return text_;
    }

private:
    std::string text_;
};

} // namespace Plexa
