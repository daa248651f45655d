// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <charconv>
#include <cstdint>
#include <string>

#include "JsonEscapes.h"
#include "MachineWalk.h"

namespace Plexa {

enum class JsonLayout { Lines, OneLine };

/// Writes JSON to anything that has append(std::string_view) and grows: a buffer, a string.
template <typename Out, JsonLayout layout>
class JsonWriter {
public:
    explicit JsonWriter(Out &out)
        : out_(out) {}

    static std::string label(std::string const &name) {
        std::string text;
        writeJsonText(text, name);
        return text + (layout == JsonLayout::Lines ? ": " : ":");
    }

    void unset() {
        put("null");
    }
    void boolean(bool value) {
        put(value ? "true" : "false");
    }
    void number(int64_t value) {
        if constexpr (requires { out_.number(value); }) {
            out_.number(value);
            return;
        }
        char digits[24];
        auto const [end, error] = std::to_chars(digits, digits + sizeof(digits), value);
        put(std::string_view(digits, static_cast<std::size_t>(end - digits)));
    }
    void text(std::string_view value) {
        writeJsonText(out_, value);
    }
    void beginList(std::size_t) {
        begin("[");
    }
    void element(std::size_t index) {
        next(index);
    }
    void endList(std::size_t count) {
        end("]", count);
    }
    void beginStruct(MetaObj::MetaStruct const &, std::size_t) {
        begin("{");
    }
    void field(FieldPlan const &field, std::size_t index) {
        next(index);
        put(field.label);
    }
    void endStruct(std::size_t count) {
        end("}", count);
    }

private:
    void put(std::string_view text) {
        out_.append(text);
    }
    void begin(std::string_view bracket) {
        put(bracket);
        line_ += "  ";
    }
    void next(std::size_t index) {
        if constexpr (layout == JsonLayout::Lines) {
            put(std::string_view(line_).substr(index > 0 ? 0 : 1));
        } else {
            put(index > 0 ? "," : "");
        }
    }
    void end(std::string_view bracket, std::size_t count) {
        line_.resize(line_.size() - 2);
        if (layout == JsonLayout::Lines && count > 0) {
            put(std::string_view(line_).substr(1));
        }
        put(bracket);
    }

    Out &out_;
    std::string line_ = ",\n"; // with the indentation behind it; the comma only between two
};

} // namespace Plexa
