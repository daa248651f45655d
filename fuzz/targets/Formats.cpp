// SPDX-License-Identifier: Apache-2.0
//
// Results of any shape with any text in them, in every format. The input is the shape and the texts. What a terminal
// may be shown holds nothing that acts on it; what a program reads is read back by a reader that is not ours.
#include <algorithm>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include <fuzzer/FuzzedDataProvider.h>
#include <pugixml.hpp>
#include <rapidjson/document.h>
#include <rapidjson/memorystream.h>

#include "Property.h"
#include "SetField.h"
#include "plexa/Formatter.h"
#include "plexa/JsonText.h"
#include "plexa/Text.h"
#include "plexa/UsageError.h"

namespace {

using namespace Plexa;
using namespace Plexa::MetaObj;
using FormatCases::setField;
using Fuzz::require;
using Object = boost::shared_ptr<MetaObject>;

constexpr unsigned deepest = 5;
constexpr std::size_t longestText = 60;

template <typename Value>
boost::shared_ptr<Value> as(Object const &object) {
    return boost::dynamic_pointer_cast<Value>(object);
}

Object valueFrom(FuzzedDataProvider &input, unsigned depth) {
    switch (input.ConsumeIntegralInRange<unsigned>(0, depth < deepest ? 7 : 4)) {
    case 0:
        return MetaString::New(input.ConsumeRandomLengthString(longestText));
    case 1:
        return MetaInt::New(input.ConsumeIntegral<int64_t>());
    case 2:
        return MetaBool::New(input.ConsumeBool());
    case 3:
        return MetaString::New();
    case 4:
        return MetaInt::New();
    case 5: {
        auto const list = MetaList::New(input.ConsumeBool() ? StringList : StructList);
        for (unsigned left = input.ConsumeIntegralInRange<unsigned>(0, 4); left > 0; --left) {
            list->Append(valueFrom(input, depth + 1));
        }
        return list;
    }
    default: {
        auto const structure = MetaStruct::New(input.ConsumeRandomLengthString(longestText));
        for (unsigned left = input.ConsumeIntegralInRange<unsigned>(0, 4); left > 0; --left) {
            std::string const name = input.ConsumeRandomLengthString(longestText);
            setField(*structure, name, valueFrom(input, depth + 1));
        }
        return structure;
    }
    }
}

/// What a command or a user may have asked of the format; only what is accepted is asked.
FormatSettings settingsFrom(FuzzedDataProvider &input, Object const &value) {
    FormatSettings settings;
    Display display;
    display.width = input.ConsumeIntegralInRange<std::size_t>(0, 100);
    display.colour = input.ConsumeBool();
    display.plain = input.ConsumeBool();
    settings.setDisplay(display);
    for (unsigned left = input.ConsumeIntegralInRange<unsigned>(0, 3); left > 0; --left) {
        std::string const assignment = input.ConsumeRandomLengthString(longestText);
        try {
            settings.setFromUser(assignment, value);
        } catch (UsageError const &mistake) {
            Fuzz::requireSentence(mistake.sentence());
        }
    }
    if (input.ConsumeBool()) {
        auto const structure = outermostStructure(value);
        std::string const names = input.ConsumeRandomLengthString(longestText);
        try {
            settings.chooseFields(structure != nullptr ? structure->GetName() : "", names,
                                  structure != nullptr ? structure->GetFieldNames() : std::vector<std::string>());
        } catch (UsageError const &mistake) {
            Fuzz::requireSentence(mistake.sentence());
        }
    }
    return settings;
}

/// Takes out the sequences that colour is made of: ESC, a bracket, digits and semicolons, an m.
std::string withoutColour(std::string_view text) {
    std::string plain;
    while (!text.empty()) {
        std::size_t const end = text.starts_with("\x1b[") ? text.find_first_not_of("0123456789;", 2) : 0;
        if (end != 0 && end != std::string_view::npos && text[end] == 'm') {
            text.remove_prefix(end + 1);
        } else {
            plain += text.front();
            text.remove_prefix(1);
        }
    }
    return plain;
}

/// @param allowed characters that are layout here
void checkHarmless(std::string_view text, std::string_view allowed, std::string const &format) {
    require(isValidUtf8(text), format + " is UTF-8", text);
    for (std::string_view left = text; !left.empty();) {
        Character const character = takeCharacter(left);
        bool const isLayout = character.bytes.size() == 1 && allowed.find(character.bytes) != std::string_view::npos;
        require(isLayout || !isUnsafeCharacter(character.code), format + " does not act on a terminal", text);
    }
}

/// What a text becomes in every format for programs: bytes that are no UTF-8 as the visible text \xff.
std::string readable(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        Character const character = takeCharacter(text);
        if (character.valid) {
            result += character.bytes;
        } else {
            constexpr char digits[] = "0123456789abcdef";
            auto const byte = static_cast<unsigned char>(character.bytes.front());
            result += {'\\', 'x', digits[byte >> 4], digits[byte & 15]};
        }
    }
    return result;
}

void checkJson(rapidjson::Value const &json, Object const &value, bool outermost, FormatSettings const &settings) {
    if (value == nullptr || !value->IsSet()) {
        require(json.IsNull(), "what is not set is null");
    } else if (auto const text = as<MetaString>(value)) {
        require(json.IsString() && std::string(json.GetString(), json.GetStringLength()) == readable(text->GetValue()),
                "a text is read back as it was", text->GetValue());
    } else if (auto const number = as<MetaInt>(value)) {
        require(json.IsInt64() && json.GetInt64() == number->GetValue(), "a number is read back as it was");
    } else if (auto const truth = as<MetaBool>(value)) {
        require(json.IsBool() && json.GetBool() == truth->GetValue(), "a truth is read back as it was");
    } else if (auto const list = as<MetaList>(value)) {
        auto const elements = list->GetElements();
        require(json.IsArray() && json.Size() == elements.size(), "a list is read back whole");
        for (rapidjson::SizeType place = 0; place < json.Size(); ++place) {
            checkJson(json[place], elements[place], outermost, settings);
        }
    } else if (auto const structure = as<MetaStruct>(value)) {
        require(json.IsObject(), "a structure is an object");
        if (outermost && settings.chosenFields()) {
            return; // other fields, in another order; a test holds which
        }
        auto const names = structure->GetFieldNames();
        require(json.MemberCount() == names.size(), "a structure is read back whole");
        auto member = json.MemberBegin();
        for (std::string const &name : names) {
            require(std::string(member->name.GetString(), member->name.GetStringLength()) == readable(name),
                    "fields are read back in their order", name);
            checkJson(member->value, structure->GetField(name), false, settings);
            ++member;
        }
    }
}

void checkDocument(std::string const &format, std::string const &text, Result const &result,
                   FormatSettings const &settings) {
    if (format == "json") {
        rapidjson::MemoryStream stream(text.data(), text.size());
        rapidjson::Document document;
        document.ParseStream<rapidjson::kParseValidateEncodingFlag, rapidjson::UTF8<>>(stream);
        require(!document.HasParseError(), "JSON is read by others", text);
        checkJson(document, result.value, true, settings);
    } else if (format == "xml") {
        pugi::xml_document document;
        require(document.load_buffer(text.data(), text.size(), pugi::parse_full), "XML is read by others", text);
        require(std::string_view(document.document_element().name()) == "result", "XML has its root", text);
    } else if (format == "csv") {
        require(std::count(text.begin(), text.end(), '"') % 2 == 0, "quotes of CSV come in pairs", text);
        require(text.ends_with("\r\n"), "a line of CSV ends", text);
    } else if (format == "yaml") {
        require(text.starts_with("---"), "YAML has its beginning", text);
    }
}

void check(char const *name, Result const &result, FormatSettings const &settings) {
    Format const &format = requireFormat(name, "--format");
    StringSink sink;
    format.write(result, settings, sink);
    StringSink again;
    format.write(result, settings, again);
    require(sink.text() == again.text(), "a format writes the same twice");
    std::string const text = !format.isMachine && settings.display().colour ? withoutColour(sink.text()) : sink.text();
    checkHarmless(text, name == std::string_view("csv") ? "\r\n" : "\n", name);
    if (format.isMachine) {
        checkDocument(name, text, result, settings);
    }
}

void checkTexts(std::string const &text) {
    std::string const shown = escaped(text);
    checkHarmless(shown, "", "an escaped text");
    require(!isPlainAscii(text) || shown == text, "a plain text stands as it is", text);
    checkHarmless(escaped(text, Lines::Keep), "\n\t", "an escaped text with lines");
    checkHarmless(jsonText(text), "", "a JSON text");
    for (std::string const &line : wrapped(shown, 20)) {
        std::size_t const word = std::min(line.find_first_not_of(' '), line.size());
        require(displayWidth(line) <= 20 || line.find(' ', word) == std::string::npos,
                "a line that is too long is one word", line);
    }
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int *, char ***) {
    setlocale(LC_ALL, "C.UTF-8"); // widths of characters
    return 0;
}

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    FuzzedDataProvider input(data, size);
    checkTexts(input.ConsumeRandomLengthString(longestText));
    Object const value = valueFrom(input, 0);
    Result const result{value, input.ConsumeBool() ? value : nullptr};
    FormatSettings const settings = settingsFrom(input, value);
    for (char const *name : {"simple", "table", "tree", "json", "yaml", "xml", "csv", "keyvalue"}) {
        check(name, result, settings);
    }
    return 0;
}
