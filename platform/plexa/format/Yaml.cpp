// SPDX-License-Identifier: Apache-2.0
//
// YAML in block style. Readers of version 1.1 and 1.2 guess the type of an unquoted text differently (yes, 1e5, 012,
// 12:30, a date), so a text stands unquoted only when none of them can take it for anything but a text; every other one
// is double-quoted.
#include <algorithm>
#include <array>
#include <string_view>

#include <fmt/format.h>

#include "Formats.h"
#include "MachineWalk.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

bool isLetter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

/// Words that some version of YAML reads as null, a truth value or a number.
bool isReserved(std::string_view text) {
    constexpr std::array<std::string_view, 11> words = {"null", "true", "false", "yes", "no", "on",
                                                        "off",  "y",    "n",     "inf", "nan"};
    return std::any_of(words.begin(), words.end(), [text](std::string_view word) {
        return std::equal(text.begin(), text.end(), word.begin(), word.end(),
                          [](char left, char right) { return (isLetter(left) ? left | 0x20 : left) == right; });
    });
}

/// Begins with a letter or a slash, and holds nothing that means something to YAML.
bool isPlain(std::string_view text) {
    if (text.empty() || !(isLetter(text.front()) || text.front() == '/') || text.back() == ' ') {
        return false;
    }
    for (std::size_t i = 0; i < text.size(); ++i) {
        char const c = text[i];
        bool const colonInside = c == ':' && i + 1 < text.size() && text[i + 1] != ' ';
        bool const harmless = isLetter(c) || (c >= '0' && c <= '9') || colonInside ||
                              std::string_view(" _-./()+@=").find(c) != std::string_view::npos;
        if (!harmless) {
            return false;
        }
    }
    return !isReserved(text);
}

/// What stands between the quotes for one character.
void appendQuoted(std::string &to, Character const &character) {
    // Readers refuse the two non-characters that end the first plane.
    bool const refused = character.code == 0xFFFE || character.code == 0xFFFF;
    if (!character.valid) {
        fmt::format_to(std::back_inserter(to), "\\\\x{:02x}", static_cast<unsigned char>(character.bytes.front()));
    } else if (character.code == U'"' || character.code == U'\\') {
        to += '\\';
        to += character.bytes;
    } else if (character.code == U'\n') {
        to += "\\n";
    } else if (!refused && !isUnsafeCharacter(character.code)) {
        to += character.bytes;
    } else if (character.code < 0x100) {
        fmt::format_to(std::back_inserter(to), "\\x{:02x}", static_cast<unsigned>(character.code));
    } else if (character.code < 0x10000) {
        fmt::format_to(std::back_inserter(to), "\\u{:04x}", static_cast<unsigned>(character.code));
    } else {
        fmt::format_to(std::back_inserter(to), "\\U{:08x}", static_cast<unsigned>(character.code));
    }
}

template <typename Out>
void writeYamlText(Out &out, std::string_view text) {
    if (isPlain(text)) {
        out.append(text);
        return;
    }
    out.append(std::string_view("\""));
    while (!text.empty()) {
        std::size_t plain = 0;
        while (plain < text.size() && text[plain] >= ' ' && text[plain] < '\x7F' && text[plain] != '"' &&
               text[plain] != '\\') {
            ++plain;
        }
        out.append(text.substr(0, plain));
        text.remove_prefix(plain);
        if (!text.empty()) {
            std::string escape;
            appendQuoted(escape, takeCharacter(text));
            out.append(std::string_view(escape));
        }
    }
    out.append(std::string_view("\""));
}

class YamlWriter {
public:
    explicit YamlWriter(TextBuffer &out)
        : out_(out) {}

    /// A reader looks for the colon of a key only so far; a longer one is announced as a key.
    static std::string label(std::string const &name) {
        constexpr std::size_t longest = 1000;
        std::string key;
        writeYamlText(key, name);
        return key.size() > longest ? "? " + key : key + ":";
    }

    void unset() {
        scalar("null");
    }
    void boolean(bool value) {
        scalar(value ? "true" : "false");
    }
    void number(int64_t value) {
        scalar("");
        out_.number(value);
    }
    void text(std::string_view value) {
        scalar("");
        writeYamlText(out_, value);
    }
    void beginList(std::size_t count) {
        begin(count, "[]");
    }
    void element(std::size_t index) {
        item(index);
        out_.append("- ");
        place_ = Place::AfterDash;
    }
    void endList(std::size_t count) {
        end(count);
    }
    void beginStruct(MetaObj::MetaStruct const &, std::size_t count) {
        begin(count, "{}");
    }
    void field(FieldPlan const &field, std::size_t index) {
        item(index);
        out_.append(field.label);
        if (field.label.back() != ':') {
            newLine();
            out_.put(':');
        }
        place_ = Place::AfterKey;
    }
    void endStruct(std::size_t count) {
        end(count);
    }

private:
    enum class Place { Start, AfterKey, AfterDash };

    void newLine() {
        out_.put('\n');
        out_.fill(indent_, ' ');
    }

    void scalar(std::string_view text) {
        if (place_ == Place::AfterKey) {
            out_.put(' ');
        }
        out_.append(text);
    }

    /// The first item of a collection that is an item itself stands on that one's line.
    void item(std::size_t index) {
        if (index > 0 || place_ == Place::AfterKey) {
            newLine();
        }
    }

    void begin(std::size_t count, std::string_view empty) {
        if (count == 0) {
            scalar(empty);
        } else if (place_ != Place::Start) {
            indent_ += step;
        }
        ++depth_;
    }

    void end(std::size_t count) {
        --depth_;
        if (count > 0 && depth_ > 0) {
            indent_ -= step;
        }
    }

    static constexpr std::size_t step = 2;
    TextBuffer &out_;
    Place place_ = Place::Start;
    std::size_t indent_ = 0;
    std::size_t depth_ = 0;
};

} // namespace

void writeYaml(Result const &result, FormatSettings const &settings, Sink &sink) {
    TextBuffer out(sink);
    YamlWriter writer(out);
    out.append("---\n");
    MachineWalk("yaml", settings, writer).result(result);
    out.put('\n');
}

} // namespace Plexa
