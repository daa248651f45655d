// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "plexa/Sink.h"

namespace Plexa {

/// Gathers small pieces of text and hands them on in large ones. What it holds is bounded; a piece that is larger than
/// its room goes to the sink as it is.
class TextBuffer {
public:
    static constexpr std::size_t room = 16384;

    explicit TextBuffer(Sink &sink)
        : sink_(sink) {}
    ~TextBuffer() {
        flush();
    }
    TextBuffer(TextBuffer const &) = delete;
    TextBuffer &operator=(TextBuffer const &) = delete;

    void append(std::string_view text) {
        if (text.size() > room - size_) {
            flush();
            if (text.size() > room) {
                sink_.write(text);
                return;
            }
        }
        std::copy(text.begin(), text.end(), buffer_.begin() + static_cast<std::ptrdiff_t>(size_));
        size_ += text.size();
    }

    /// The text between two quotes.
    void appendQuoted(std::string_view text) {
        if (text.size() + 2 > room - size_) {
            put('"');
            append(text);
            put('"');
            return;
        }
        char *const at = buffer_.data() + size_;
        at[0] = '"';
        std::copy(text.begin(), text.end(), at + 1);
        at[text.size() + 1] = '"';
        size_ += text.size() + 2;
    }

    template <typename... Pieces>
    void print(Pieces const &...pieces) {
        (append(std::string_view(pieces)), ...);
    }

    void put(char c) {
        if (size_ == room) {
            flush();
        }
        buffer_[size_++] = c;
    }

    void fill(std::size_t count, char c) {
        while (count > 0) {
            if (size_ == room) {
                flush();
            }
            std::size_t const part = std::min(count, room - size_);
            std::fill_n(buffer_.begin() + static_cast<std::ptrdiff_t>(size_), part, c);
            size_ += part;
            count -= part;
        }
    }

    void number(int64_t value) {
        std::array<char, 24> digits;
        auto const [end, error] = std::to_chars(digits.data(), digits.data() + digits.size(), value);
        append(std::string_view(digits.data(), static_cast<std::size_t>(end - digits.data())));
    }

    void flush() {
        if (size_ > 0) {
            sink_.write(std::string_view(buffer_.data(), size_));
            size_ = 0;
        }
    }

private:
    Sink &sink_;
    std::size_t size_ = 0;
    std::array<char, room> buffer_; // not initialised: only what was written is read
};

} // namespace Plexa
