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
#include <string>
#include <string_view>
#include <vector>

namespace Plexa {

/// Whether a text can be shown as it is and takes one column a byte.
inline bool isPlainAscii(std::string_view text) {
    bool plain = true;
    for (char const c : text) { // without a way out, so that it is done many bytes at a time
        plain &= (c >= ' ') & (c != '\x7F');
    }
    return plain;
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
