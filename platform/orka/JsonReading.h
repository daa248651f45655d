// SPDX-License-Identifier: Apache-2.0
//
// Reading a JSON document member by member, with the path of whatever is wrong. A node knows its parent, and its path
// is put together only when a sentence needs it: a document of a million members costs no path.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>

#include <rapidjson/document.h>

namespace Orka {

class JsonNode {
public:
    JsonNode(rapidjson::Value const &value, std::string const &sourceName)
        : value_(&value)
        , sourceName_(&sourceName) {}
    JsonNode(rapidjson::Value const &value, JsonNode const &parent, std::string_view name)
        : value_(&value)
        , parent_(&parent)
        , name_(name)
        , sourceName_(parent.sourceName_) {}
    JsonNode(rapidjson::Value const &value, JsonNode const &parent, size_t index)
        : value_(&value)
        , parent_(&parent)
        , index_(index)
        , sourceName_(parent.sourceName_) {}

    rapidjson::Value const &value() const noexcept {
        return *value_;
    }
    /// Throws InvalidArgument: source, path, what is wrong.
    [[noreturn]] void fail(std::string const &what) const;

    // What the node itself must be.
    std::string text() const;
    /// A text that is not empty.
    std::string name() const;
    int64_t integer(int64_t least, int64_t most) const;
    bool boolean() const;
    void requireObject() const;
    /// A list; calls `visit` with a node for each element.
    template <typename Visit>
    void each(Visit &&visit) const {
        requireList();
        size_t index = 0;
        for (auto const &element : value_->GetArray()) {
            visit(JsonNode(element, *this, index++));
        }
    }

private:
    std::string path() const;
    void requireList() const;
    std::string whatItIs() const;

    rapidjson::Value const *value_;
    JsonNode const *parent_ = nullptr;
    std::string_view name_;
    size_t index_ = 0;
    std::string const *sourceName_;
};

/// An object whose members are read by name. A member that is null counts as absent.
class JsonObject {
public:
    /// Fails when the node is no object, or has a member that is not in the list, or has one twice. Refers to the node.
    JsonObject(JsonNode const &node, std::initializer_list<std::string_view> members);

    bool has(std::string_view member) const;
    /// The member, which must be there.
    JsonNode at(std::string_view member) const;

    std::optional<std::string> optionalText(std::string_view member) const;
    std::string textOr(std::string_view member, std::string const &otherwise) const;
    bool booleanOr(std::string_view member, bool otherwise) const;
    int64_t integerOr(std::string_view member, int64_t least, int64_t most, int64_t otherwise) const;
    template <typename Visit>
    void each(std::string_view member, Visit &&visit) const {
        if (has(member)) {
            auto const list = at(member);
            list.each(visit);
        }
    }

private:
    rapidjson::Value const *find(std::string_view member) const;

    JsonNode const *node_;
};

/// A text as it can stand in a sentence: in double quotes, shortened when long, control characters escaped.
std::string quoted(std::string_view text);

/// @throws Wire::Failure InvalidArgument naming line and column
void parseJson(std::string_view json, std::string const &sourceName, rapidjson::Document &document);

} // namespace Orka
