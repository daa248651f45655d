// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <rapidjson/document.h>

#include "JsonReading.h"
#include "https/Base64.h"
#include "https/Messages.h"
#include "wire/ContainerId.h"

namespace Orka::Https {

/// Reads values from JSON by their fields(). A member that nobody asks for is passed over, so that a newer peer may
/// tell more; one that is missing or of another kind is a Wire::Failure InvalidArgument with its path.
class BodyReader {
public:
    explicit BodyReader(JsonNode const &node)
        : node_(node) {
        node.requireObject();
    }

    void text(char const *member, std::string &value) {
        value = at(member).text();
    }
    void text(char const *member, std::optional<std::string> &value) {
        if (has(member)) {
            value = at(member).text();
        }
    }
    void name(char const *member, std::string &value) {
        value = at(member).name();
    }
    void uuid(char const *member, std::string &value) {
        auto const node = at(member);
        auto canonical = Wire::normalizeContainerId(node.text());
        if (!canonical) {
            node.fail("a UUID is expected, not " + Orka::quoted(node.text()));
        }
        value = *std::move(canonical);
    }
    void number(char const *member, int64_t &value) {
        value = at(member).integer(std::numeric_limits<int64_t>::min(), std::numeric_limits<int64_t>::max());
    }
    void number(char const *member, int32_t &value) {
        value = static_cast<int32_t>(
            at(member).integer(std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()));
    }
    void amount(char const *member, int64_t &value) {
        value = at(member).integer(0, std::numeric_limits<int64_t>::max());
    }
    void amount(char const *member, std::optional<int64_t> &value) {
        if (has(member)) {
            value = at(member).integer(0, std::numeric_limits<int64_t>::max());
        }
    }
    void flag(char const *member, bool &value) {
        value = at(member).boolean();
    }
    void kind(char const *member, VolumeKind &value) {
        auto const node = at(member);
        auto const word = node.text();
        if (word != "config" && word != "data") {
            node.fail("\"config\" or \"data\" is expected, not " + Orka::quoted(word));
        }
        value = word == "data" ? VolumeKind::Data : VolumeKind::Config;
    }
    void bytes(char const *member, std::vector<uint8_t> &value) {
        auto const node = at(member);
        auto decoded = fromBase64(node.text());
        if (!decoded) {
            node.fail("base64 is expected");
        }
        value = *std::move(decoded);
    }
    void texts(char const *member, std::vector<std::string> &values) {
        at(member).each([&](JsonNode const &element) { values.push_back(element.text()); });
    }
    template <typename T>
    void list(char const *member, std::vector<T> &values) {
        auto const node = at(member);
        if (node.value().IsArray()) {
            values.reserve(node.value().Size());
        }
        node.each([&](JsonNode const &element) { read(element, values.emplace_back()); });
    }
    template <typename T>
    void structure(char const *member, T &value) {
        read(at(member), value);
    }
    template <typename T>
    void structure(char const *member, std::optional<T> &value) {
        if (has(member)) {
            read(at(member), value.emplace());
        }
    }

private:
    template <typename T>
    static void read(JsonNode const &node, T &value) {
        BodyReader reader(node);
        fields(reader, value);
    }
    rapidjson::Value const *find(char const *member) const {
        auto const found = node_.value().FindMember(member);
        return found == node_.value().MemberEnd() || found->value.IsNull() ? nullptr : &found->value;
    }
    bool has(char const *member) const {
        return find(member) != nullptr;
    }
    JsonNode at(char const *member) const {
        auto const *const value = find(member);
        if (value == nullptr) {
            node_.fail("the member " + Orka::quoted(member) + " is missing");
        }
        return {*value, node_, member};
    }

    JsonNode const &node_;
};

/// Reads one document into every value given. @param source what the document is called in failures
/// @throws Wire::Failure InvalidArgument
template <typename... Objects>
void readBody(std::string_view json, std::string const &source, Objects &...objects) {
    rapidjson::Document document;
    parseJson(json, source, document);
    JsonNode const root(document, source);
    BodyReader reader(root);
    (fields(reader, objects), ...);
}

} // namespace Orka::Https
