// SPDX-License-Identifier: Apache-2.0
//
// XML 1.0: an element for each value, named after its type, with the field's name as its attribute "key".
//
//   <result>
//     <list>
//       <record key="..." type="...">   <text key="...">   <int key="...">   <bool key="...">   <null key="..."/>
//
// A text that holds characters which XML cannot (most controls) is the base64 form of its UTF-8 bytes and says so by
// encoding="base64"; a name that does stands in key-base64 or type-base64.
#include <array>
#include <string_view>

#include <fmt/format.h>

#include "Formats.h"
#include "MachineWalk.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

bool isForbidden(char32_t code) {
    return (code < 0x20 && code != U'\t' && code != U'\n' && code != U'\r') || code == 0xFFFE || code == 0xFFFF;
}

bool isPlain(char c) {
    return c >= ' ' && c < '\x7F' && c != '<' && c != '>' && c != '&' && c != '"';
}

bool canHold(std::string_view text) {
    while (!text.empty()) {
        if (isPlain(text.front())) {
            text.remove_prefix(1);
        } else if (Character const character = takeCharacter(text); character.valid && isForbidden(character.code)) {
            return false;
        }
    }
    return true;
}

/// Bytes that are no UTF-8 become the visible text \xff.
void appendVisible(std::string &to, Character const &character) {
    fmt::format_to(std::back_inserter(to), "\\x{:02x}", static_cast<unsigned char>(character.bytes.front()));
}

std::string escapeOf(Character const &character) {
    std::string text;
    if (!character.valid) {
        appendVisible(text, character);
    } else if (character.code == U'<') {
        text = "&lt;";
    } else if (character.code == U'>') {
        text = "&gt;";
    } else if (character.code == U'&') {
        text = "&amp;";
    } else if (character.code == U'"') {
        text = "&quot;";
    } else if (isUnsafeCharacter(character.code)) {
        fmt::format_to(std::back_inserter(text), "&#{};", static_cast<unsigned>(character.code));
    } else {
        text = character.bytes;
    }
    return text;
}

template <typename Out>
void writeEscaped(Out &out, std::string_view text) {
    while (!text.empty()) {
        std::size_t plain = 0;
        while (plain < text.size() && isPlain(text[plain])) {
            ++plain;
        }
        out.append(text.substr(0, plain));
        text.remove_prefix(plain);
        if (!text.empty()) {
            out.append(std::string_view(escapeOf(takeCharacter(text))));
        }
    }
}

/// Turns bytes into base64 as they come.
template <typename Out>
class Base64 {
public:
    explicit Base64(Out &out)
        : out_(out) {}
    void append(std::string_view bytes) {
        for (char const byte : bytes) {
            group_ = group_ << 8 | static_cast<unsigned char>(byte);
            if (++held_ == 3) {
                write(4);
            }
        }
    }
    void finish() {
        if (held_ > 0) {
            std::size_t const digits = held_ + 1;
            group_ <<= 8 * (3 - held_);
            write(digits);
            out_.append(std::string_view("==").substr(0, 4 - digits));
        }
    }

private:
    void write(std::size_t digits) {
        constexpr std::string_view alphabet = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
        std::array<char, 4> text{};
        for (std::size_t i = 0; i < text.size(); ++i) {
            text[i] = alphabet[group_ >> (18 - 6 * i) & 0x3F];
        }
        out_.append(std::string_view(text.data(), digits));
        group_ = 0;
        held_ = 0;
    }

    Out &out_;
    unsigned group_ = 0;
    std::size_t held_ = 0;
};

template <typename Out>
void writeBase64(Out &out, std::string_view text) {
    Base64<Out> base64(out);
    while (!text.empty()) {
        Character const character = takeCharacter(text);
        std::string visible;
        if (!character.valid) {
            appendVisible(visible, character);
        }
        base64.append(character.valid ? character.bytes : std::string_view(visible));
    }
    base64.finish();
}

std::string attribute(std::string const &name, std::string const &value) {
    std::string text;
    if (canHold(value)) {
        text = " " + name + "=\"";
        writeEscaped(text, value);
    } else {
        text = " " + name + "-base64=\"";
        writeBase64(text, value);
    }
    return text + '"';
}

class XmlWriter {
public:
    explicit XmlWriter(TextBuffer &out)
        : out_(out) {}

    static std::string label(std::string const &name) {
        return attribute("key", name);
    }

    void unset() {
        open("null", "", "/>\n");
    }
    void boolean(bool value) {
        open("bool", "", ">");
        out_.append(value ? "true" : "false");
        out_.append("</bool>\n");
    }
    void number(int64_t value) {
        open("int", "", ">");
        out_.number(value);
        out_.append("</int>\n");
    }
    void text(std::string_view value) {
        if (canHold(value)) {
            open("text", "", ">");
            writeEscaped(out_, value);
        } else {
            open("text", "", " encoding=\"base64\">");
            writeBase64(out_, value);
        }
        out_.append("</text>\n");
    }
    void beginList(std::size_t count) {
        begin("list", "", count);
    }
    void element(std::size_t) {
        key_ = {};
    }
    void endList(std::size_t count) {
        end("</list>\n", count);
    }
    void beginStruct(MetaObj::MetaStruct const &structure, std::size_t count) {
        if (type_.empty() || structure.GetName() != typeName_) {
            typeName_ = structure.GetName();
            type_ = attribute("type", typeName_);
        }
        begin("record", type_, count);
    }
    void field(FieldPlan const &field, std::size_t) {
        key_ = field.label;
    }
    void endStruct(std::size_t count) {
        end("</record>\n", count);
    }

private:
    void open(std::string_view name, std::string_view attributes, std::string_view rest) {
        out_.fill(indent_, ' ');
        out_.put('<');
        out_.append(name);
        out_.append(key_);
        out_.append(attributes);
        out_.append(rest);
    }
    void begin(std::string_view name, std::string_view attributes, std::size_t count) {
        open(name, attributes, count == 0 ? "/>\n" : ">\n");
        key_ = {};
        indent_ += step;
    }
    void end(std::string_view tag, std::size_t count) {
        indent_ -= step;
        if (count > 0) {
            out_.fill(indent_, ' ');
            out_.append(tag);
        }
    }

    static constexpr std::size_t step = 2;
    TextBuffer &out_;
    std::size_t indent_ = step;
    std::string_view key_; // of the value that comes next, as an attribute
    std::string typeName_;
    std::string type_; // the last structure's name, as an attribute
};

} // namespace

void writeXml(Result const &result, FormatSettings const &settings, Sink &sink) {
    TextBuffer out(sink);
    out.append("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<result>\n");
    XmlWriter writer(out);
    MachineWalk("xml", settings, writer).result(result);
    out.append("</result>\n");
}

} // namespace Plexa
