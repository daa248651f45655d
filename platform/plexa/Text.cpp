// SPDX-License-Identifier: Apache-2.0
#include "plexa/Text.h"

#include <algorithm>
#include <clocale>
#include <cwchar>
#include <iterator>

#include <boost/locale/utf.hpp>

namespace Plexa {

namespace {

struct Range {
    char32_t first;
    char32_t last;
};

// Sorted. General categories Cc, Cf, Zl and Zp, and what is by default not shown at all (fillers, selectors, tags).
constexpr Range unsafeRanges[] = {
    {0x0000, 0x001F},   {0x007F, 0x009F},   {0x00AD, 0x00AD},   {0x034F, 0x034F},   {0x0600, 0x0605},
    {0x061C, 0x061C},   {0x06DD, 0x06DD},   {0x070F, 0x070F},   {0x0890, 0x0891},   {0x08E2, 0x08E2},
    {0x115F, 0x1160},   {0x17B4, 0x17B5},   {0x180B, 0x180F},   {0x200B, 0x200F},   {0x2028, 0x202E},
    {0x2060, 0x206F},   {0x3164, 0x3164},   {0xFE00, 0xFE0F},   {0xFEFF, 0xFEFF},   {0xFFA0, 0xFFA0},
    {0xFFF0, 0xFFFB},   {0x110BD, 0x110BD}, {0x110CD, 0x110CD}, {0x13430, 0x1343F}, {0x1BCA0, 0x1BCA3},
    {0x1D173, 0x1D17A}, {0xE0000, 0xE0FFF},
};

void appendHex(std::string &to, char32_t value, unsigned digits) {
    constexpr char const *alphabet = "0123456789abcdef";
    for (unsigned left = digits; left > 0; --left) {
        to += alphabet[(value >> (4 * (left - 1))) & 0xF];
    }
}

void appendEscape(std::string &to, Character const &character) {
    if (!character.valid) {
        to += "\\x";
        appendHex(to, static_cast<unsigned char>(character.bytes.front()), 2);
    } else if (character.code == U'\n') {
        to += "\\n";
    } else if (character.code == U'\r') {
        to += "\\r";
    } else if (character.code == U'\t') {
        to += "\\t";
    } else if (character.code < 0x80) {
        to += "\\x";
        appendHex(to, character.code, 2);
    } else if (character.code < 0x10000) {
        to += "\\u";
        appendHex(to, character.code, 4);
    } else {
        to += "\\U";
        appendHex(to, character.code, 8);
    }
}

/// Lets this thread's wcwidth know every character, whatever the user's locale is: output is always UTF-8.
class WidthLocale {
public:
    WidthLocale()
        : before_(utf8() != nullptr ? uselocale(utf8()) : nullptr) {}
    ~WidthLocale() {
        if (before_ != nullptr) {
            uselocale(before_);
        }
    }
    WidthLocale(WidthLocale const &) = delete;
    WidthLocale &operator=(WidthLocale const &) = delete;

private:
    /// Read from disk, so once a process, and by those only that meet more than ASCII.
    static locale_t utf8() {
        static locale_t const locale = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
        return locale;
    }

    locale_t before_;
};

} // namespace

bool equalIgnoringCase(std::string_view left, std::string_view right) {
    auto const lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; };
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [&](char a, char b) { return lower(a) == lower(b); });
}

bool isValidUtf8(std::string_view text) {
    while (!text.empty()) {
        if (!takeCharacter(text).valid) {
            return false;
        }
    }
    return true;
}

Character takeCharacter(std::string_view &text) {
    using Utf8 = boost::locale::utf::utf_traits<char>;
    char const *position = text.data();
    boost::locale::utf::code_point const code = Utf8::decode(position, text.data() + text.size());
    bool const valid = code != boost::locale::utf::illegal && code != boost::locale::utf::incomplete;
    std::size_t const length = valid ? static_cast<std::size_t>(position - text.data()) : 1;
    Character const taken{text.substr(0, length), valid ? static_cast<char32_t>(code) : U'\0', valid};
    text.remove_prefix(length);
    return taken;
}

bool isUnsafeCharacter(char32_t code) {
    auto const next = std::upper_bound(std::begin(unsafeRanges), std::end(unsafeRanges), code,
                                       [](char32_t value, Range const &range) { return value < range.first; });
    return next != std::begin(unsafeRanges) && code <= std::prev(next)->last;
}

std::string escaped(std::string_view text, Lines lines) {
    if (isPlainAscii(text)) {
        return std::string(text);
    }
    std::string shown;
    shown.reserve(text.size() + 8);
    while (!text.empty()) {
        Character const character = takeCharacter(text);
        bool const layout = lines == Lines::Keep && (character.code == U'\n' || character.code == U'\t');
        if (character.valid && (layout || !isUnsafeCharacter(character.code))) {
            shown += character.bytes;
        } else {
            appendEscape(shown, character);
        }
    }
    return shown;
}

std::size_t displayWidth(std::string_view text) {
    if (isPlainAscii(text)) {
        return text.size();
    }
    WidthLocale const locale;
    std::size_t width = 0;
    while (!text.empty()) {
        Character const character = takeCharacter(text);
        int const columns = character.valid ? wcwidth(static_cast<wchar_t>(character.code)) : 1;
        width += columns < 0 ? 1 : static_cast<std::size_t>(columns);
    }
    return width;
}

std::vector<std::string> wrapped(std::string_view text, std::size_t width) {
    std::vector<std::string> lines;
    while (true) {
        std::string_view const paragraph = text.substr(0, text.find('\n'));
        std::string line;
        std::size_t position = 0;
        while (position < paragraph.size()) {
            // A word with the blanks before it, so that blanks inside a line stay as they were written.
            std::size_t const wordStart = std::min(paragraph.find_first_not_of(' ', position), paragraph.size());
            std::size_t const wordEnd = std::min(paragraph.find(' ', wordStart), paragraph.size());
            std::string_view const spaced = paragraph.substr(position, wordEnd - position);
            if (!line.empty() && displayWidth(line) + displayWidth(spaced) > width) {
                lines.push_back(line);
                line = paragraph.substr(wordStart, wordEnd - wordStart);
            } else {
                line += spaced;
            }
            position = wordEnd;
        }
        lines.push_back(line);
        if (paragraph.size() == text.size()) {
            return lines;
        }
        text.remove_prefix(paragraph.size() + 1);
    }
}

void appendWrapped(std::string &to, std::string_view text, std::size_t indent, std::size_t width) {
    constexpr std::size_t narrowest = 20; // on a narrower screen the terminal breaks the lines itself
    for (std::string const &line : wrapped(text, std::max(narrowest, width > indent ? width - indent : 0))) {
        to.append(line.empty() ? 0 : indent, ' ');
        to += line;
        to += '\n';
    }
}

} // namespace Plexa
