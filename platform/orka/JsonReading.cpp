// SPDX-License-Identifier: Apache-2.0
#include "JsonReading.h"

#include <algorithm>
#include <charconv>

#include <fmt/format.h>
#include <rapidjson/error/en.h>
#include <rapidjson/memorystream.h>

#include "wire/Failure.h"

namespace Orka {

namespace {

constexpr size_t quotedCharactersMax = 80;

bool isNamed(rapidjson::Value::Member const &member, std::string_view name) {
    return std::string_view(member.name.GetString(), member.name.GetStringLength()) == name;
}

/// The code unit that an escape stands for: the four digits behind "\\u" in a document that was parsed.
unsigned unitAt(std::string_view json, size_t digits) {
    unsigned unit = 0;
    std::from_chars(json.data() + digits, json.data() + digits + 4, unit, 16);
    return unit;
}

/// Where the second half of a surrogate pair is escaped without the first; the parser makes bytes of it that are no
/// UTF-8. Takes a document that was parsed.
std::optional<size_t> loneSurrogate(std::string_view json) {
    size_t at = json.find('\\');
    while (at != std::string_view::npos) {
        size_t length = 2;
        if (json[at + 1] == 'u') {
            unsigned const unit = unitAt(json, at + 2);
            if (unit >= 0xDC00 && unit <= 0xDFFF) {
                return at;
            }
            bool const beginsPair = unit >= 0xD800 && unit <= 0xDBFF; // the parser has seen its other half
            length = beginsPair ? 12 : 6;
        }
        at = json.find('\\', at + length);
    }
    return std::nullopt;
}

[[noreturn]] void failParsing(std::string_view json, std::string const &sourceName, rapidjson::ParseErrorCode code,
                              size_t offset) {
    auto const before = json.substr(0, std::min(offset, json.size()));
    auto const lineStart = before.rfind('\n');
    auto const line = std::count(before.begin(), before.end(), '\n') + 1;
    auto const column = lineStart == std::string_view::npos ? before.size() + 1 : before.size() - lineStart;
    throw Wire::Failure(Wire::ErrorCode::InvalidArgument, fmt::format("{}: line {}, column {}: {}", sourceName, line,
                                                                      column, rapidjson::GetParseError_En(code)));
}

} // namespace

std::string quoted(std::string_view text) {
    std::string result = "\"";
    size_t characters = 0;
    for (auto const character : text) {
        auto const byte = static_cast<unsigned char>(character);
        // Bytes that continue a character count with it, so that none is cut in two.
        if ((byte & 0xc0) != 0x80 && ++characters > quotedCharactersMax) {
            return result + "...\"";
        }
        if (byte < 0x20 || byte == 0x7f) {
            result += fmt::format("\\u{:04x}", byte);
        } else if (byte == '"' || byte == '\\') {
            result += '\\';
            result += character;
        } else {
            result += character;
        }
    }
    return result + '"';
}

void parseJson(std::string_view json, std::string const &sourceName, rapidjson::Document &document) {
    rapidjson::MemoryStream stream(json.data(), json.size());
    // Iterative: nesting costs no stack. Not in full precision, which is undefined for 0e300: what is no whole number
    // is refused anyway.
    constexpr unsigned flags = rapidjson::kParseIterativeFlag | rapidjson::kParseValidateEncodingFlag;
    document.ParseStream<flags, rapidjson::UTF8<>>(stream);
    if (document.HasParseError()) {
        failParsing(json, sourceName, document.GetParseError(), document.GetErrorOffset());
    }
    if (stream.Tell() < json.size()) { // at a NUL, which the parser takes for the end
        failParsing(json, sourceName, rapidjson::kParseErrorDocumentRootNotSingular, stream.Tell());
    }
    if (std::optional<size_t> const lone = loneSurrogate(json)) {
        failParsing(json, sourceName, rapidjson::kParseErrorStringUnicodeSurrogateInvalid, *lone);
    }
}

std::string JsonNode::path() const {
    if (parent_ == nullptr) {
        return "";
    }
    auto const above = parent_->path();
    if (name_.data() == nullptr) {
        return fmt::format("{}[{}]", above, index_);
    }
    return above.empty() ? std::string(name_) : fmt::format("{}.{}", above, name_);
}

void JsonNode::fail(std::string const &what) const {
    auto const where = path();
    throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                        fmt::format("{}: {}: {}", *sourceName_, where.empty() ? "the document" : where, what));
}

std::string JsonNode::whatItIs() const {
    switch (value_->GetType()) {
    case rapidjson::kNullType:
        return "null";
    case rapidjson::kFalseType:
        return "false";
    case rapidjson::kTrueType:
        return "true";
    case rapidjson::kObjectType:
        return "an object";
    case rapidjson::kArrayType:
        return "a list";
    case rapidjson::kStringType:
        return "the text " + quoted({value_->GetString(), value_->GetStringLength()});
    case rapidjson::kNumberType:
        return value_->IsInt64()    ? std::to_string(value_->GetInt64())
               : value_->IsUint64() ? std::to_string(value_->GetUint64())
                                    : fmt::format("the number {}", value_->GetDouble());
    }
    return "something else";
}

std::string JsonNode::text() const {
    if (!value_->IsString()) {
        fail("a text is expected, not " + whatItIs());
    }
    std::string text(value_->GetString(), value_->GetStringLength());
    if (text.find('\0') != std::string::npos) {
        fail("a text cannot hold the character NUL");
    }
    return text;
}

std::string JsonNode::name() const {
    auto result = text();
    if (result.empty()) {
        fail("an empty text is not allowed here");
    }
    return result;
}

int64_t JsonNode::integer(int64_t least, int64_t most) const {
    if (!value_->IsNumber()) {
        fail("a whole number is expected, not " + whatItIs());
    }
    if (!value_->IsInt64() || value_->GetInt64() < least || value_->GetInt64() > most) {
        fail(fmt::format("a whole number from {} to {} is expected, not {}", least, most, whatItIs()));
    }
    return value_->GetInt64();
}

bool JsonNode::boolean() const {
    if (!value_->IsBool()) {
        fail("true or false is expected, not " + whatItIs());
    }
    return value_->GetBool();
}

void JsonNode::requireList() const {
    if (!value_->IsArray()) {
        fail("a list is expected, not " + whatItIs());
    }
}

void JsonNode::requireObject() const {
    if (!value_->IsObject()) {
        fail("an object is expected, not " + whatItIs());
    }
}

JsonObject::JsonObject(JsonNode const &node, std::initializer_list<std::string_view> members)
    : node_(&node) {
    auto const &value = node.value();
    node.requireObject();
    for (auto member = value.MemberBegin(); member != value.MemberEnd(); ++member) {
        std::string_view const name(member->name.GetString(), member->name.GetStringLength());
        if (std::find(members.begin(), members.end(), name) == members.end()) {
            node.fail(fmt::format("there is no member {} here; known are: {}", quoted(name), fmt::join(members, ", ")));
        }
        if (std::find_if(value.MemberBegin(), member, [&](auto const &other) { return isNamed(other, name); }) !=
            member) {
            node.fail(fmt::format("the member {} stands here twice", quoted(name)));
        }
    }
}

rapidjson::Value const *JsonObject::find(std::string_view member) const {
    auto const &value = node_->value();
    auto const found = std::find_if(value.MemberBegin(), value.MemberEnd(),
                                    [&](auto const &candidate) { return isNamed(candidate, member); });
    return found == value.MemberEnd() || found->value.IsNull() ? nullptr : &found->value;
}

bool JsonObject::has(std::string_view member) const {
    return find(member) != nullptr;
}

JsonNode JsonObject::at(std::string_view member) const {
    auto const *const value = find(member);
    if (value == nullptr) {
        node_->fail(fmt::format("the member {} is missing", quoted(member)));
    }
    return {*value, *node_, member};
}

std::optional<std::string> JsonObject::optionalText(std::string_view member) const {
    return has(member) ? std::optional(at(member).text()) : std::nullopt;
}

std::string JsonObject::textOr(std::string_view member, std::string const &otherwise) const {
    return has(member) ? at(member).text() : otherwise;
}

bool JsonObject::booleanOr(std::string_view member, bool otherwise) const {
    return has(member) ? at(member).boolean() : otherwise;
}

int64_t JsonObject::integerOr(std::string_view member, int64_t least, int64_t most, int64_t otherwise) const {
    return has(member) ? at(member).integer(least, most) : otherwise;
}

} // namespace Orka
