// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Plexa {

/// Where text goes: a terminal, a file, a pipe, a test's string.
class Sink {
public:
    virtual ~Sink() = default;
    /// Takes the text as it is. Never throws; what could not be written is told by problem(), and writing on is
    /// harmless.
    virtual void write(std::string_view text) = 0;
    /// Why not everything written has arrived; empty while it has.
    virtual std::string problem() const {
        return {};
    }
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
