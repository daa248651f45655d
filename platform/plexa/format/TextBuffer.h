// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
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
        copy(buffer_.data() + size_, text);
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
        copy(at + 1, text);
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
        constexpr std::size_t few = 16;
        if (count <= few && few <= room - size_) { // of which what is too much is written over
            std::memset(buffer_.data() + size_, c, few);
            size_ += count;
            return;
        }
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
        constexpr std::size_t longest = 24;
        if (room - size_ < longest) {
            flush();
        }
        char *const at = buffer_.data() + size_;
        size_ += static_cast<std::size_t>(std::to_chars(at, at + longest, value).ptr - at);
    }

    void flush() {
        if (size_ > 0) {
            sink_.write(std::string_view(buffer_.data(), size_));
            size_ = 0;
        }
    }

private:
    /// Most pieces are labels and names; copied in two moves that may overlap they take no call.
    static void copy(char *to, std::string_view text) {
        std::size_t const size = text.size();
        char const *const from = text.data();
        if (size > 32) {
            std::memcpy(to, from, size);
        } else if (size >= 16) {
            std::memcpy(to, from, 16);
            std::memcpy(to + size - 16, from + size - 16, 16);
        } else if (size >= 8) {
            std::memcpy(to, from, 8);
            std::memcpy(to + size - 8, from + size - 8, 8);
        } else {
            for (std::size_t i = 0; i < size; ++i) {
                to[i] = from[i];
            }
        }
    }

    Sink &sink_;
    std::size_t size_ = 0;
    std::array<char, room> buffer_; // not initialised: only what was written is read
};

} // namespace Plexa
