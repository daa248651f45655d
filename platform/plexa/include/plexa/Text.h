// SPDX-License-Identifier: Apache-2.0
//
// Text for people: what others wrote made safe to show, its width on a terminal, and lines broken to a width.
//
// Names, URLs and error sentences reach the user from arrays, providers and other users. On a terminal a control
// character in them could move the cursor or retitle the window, and a bidi override could make one name look like
// another. So every human format passes such text through escaped(), and nothing else prints it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

namespace Plexa {

/// Whether a text is of printing characters of ASCII alone, without the exceptions. Names and ids are short, and are
/// looked at so often that a loop's preparations would show: eight bytes at a time, the last eight a second time if
/// need be.
template <char... exceptions>
inline bool isPlainAsciiBut(std::string_view text) {
    constexpr uint64_t ones = ~uint64_t{0} / 0xFF;
    constexpr uint64_t highBits = ones * 0x80;
    // A byte's high bit ends up set where the byte has one, is below a blank, or is DEL or an exception (which the XOR
    // turns into 0). A borrow from the byte before comes from one of those only.
    auto const marked = [](uint64_t bytes) {
        uint64_t marks = bytes | (bytes - ones * ' ') | ((bytes ^ (ones * 0x7F)) - ones);
        ((marks |= (bytes ^ (ones * static_cast<unsigned char>(exceptions))) - ones), ...);
        return marks & highBits;
    };
    auto const loaded = [](char const *from) {
        uint64_t bytes = 0;
        std::memcpy(&bytes, from, sizeof(bytes));
        return bytes;
    };
    char const *const data = text.data();
    std::size_t const size = text.size();
    if (size >= sizeof(uint64_t)) {
        uint64_t marks = marked(loaded(data + size - sizeof(uint64_t)));
        for (std::size_t at = 0; at + sizeof(uint64_t) < size; at += sizeof(uint64_t)) {
            marks |= marked(loaded(data + at));
        }
        return marks == 0;
    }
    uint64_t bytes = ones * '0'; // of which a short text replaces some
    for (std::size_t i = 0; i < size; ++i) {
        bytes = bytes << 8 | static_cast<unsigned char>(data[i]);
    }
    return marked(bytes) == 0;
}

/// Whether a text can be shown as it is and takes one column a byte.
inline bool isPlainAscii(std::string_view text) {
    return isPlainAsciiBut<>(text);
}

bool isValidUtf8(std::string_view text);

/// Keywords as users type them. Only letters of ASCII have a case here, whatever the locale; and none is set up for it,
/// which would cost a short command a twentieth of its time.
bool equalIgnoringCase(std::string_view left, std::string_view right);

/// One character taken from the front of a text.
struct Character {
    std::string_view bytes; ///< the bytes that it stood in; one byte when they are no UTF-8
    char32_t code;          ///< its code point; not meaningful when invalid
    bool valid;
};

/// Takes the first character off a text that is not empty.
Character takeCharacter(std::string_view &text);

/// True for what would act on a terminal or hide in it: controls, bidi and other format characters, line and paragraph
/// separators, characters that show nothing.
bool isUnsafeCharacter(char32_t code);

/// Whether a text's line ends and tabs are layout, to be kept, or data like any other, to be escaped.
enum class Lines { Escape, Keep };

/// A text safe to show: unsafe characters as \n, \x1b or \u202e, bytes that are no UTF-8 as \xff. Always valid UTF-8.
std::string escaped(std::string_view text, Lines lines = Lines::Escape);

/// Columns that a text takes on a terminal. Expects what escaped() returned.
std::size_t displayWidth(std::string_view text);

/// The text in lines of at most width columns, broken at blanks; a longer word stands alone. Blanks inside a line and
/// line ends of the text are kept.
std::vector<std::string> wrapped(std::string_view text, std::size_t width);

/// Appends text below an indentation, wrapped so that the lines end at column width; every line ends in a newline.
void appendWrapped(std::string &to, std::string_view text, std::size_t indent, std::size_t width);

} // namespace Plexa
