// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

#include <fmt/format.h>

#include "plexa/Sink.h"

namespace Plexa {

/// Gathers small pieces of text and hands them on in large ones.
class TextBuffer {
public:
    explicit TextBuffer(Sink &sink)
        : sink_(sink) {}
    ~TextBuffer() {
        flush();
    }
    TextBuffer(TextBuffer const &) = delete;
    TextBuffer &operator=(TextBuffer const &) = delete;

    template <typename... Values>
    void print(fmt::format_string<Values...> pattern, Values &&...values) {
        fmt::format_to(fmt::appender(buffer_), pattern, std::forward<Values>(values)...);
        if (buffer_.size() >= enough) {
            flush();
        }
    }

    void put(char c) {
        buffer_.push_back(c);
        if (buffer_.size() >= enough) {
            flush();
        }
    }

    void flush() {
        sink_.write(std::string_view(buffer_.data(), buffer_.size()));
        buffer_.clear();
    }

private:
    static constexpr std::size_t enough = 16384;
    Sink &sink_;
    fmt::memory_buffer buffer_;
};

} // namespace Plexa
