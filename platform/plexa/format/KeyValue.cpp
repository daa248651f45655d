// SPDX-License-Identifier: Apache-2.0
//
// One line a value: its path, an equals sign, and the value as JSON has it.
//
//   [0].Container Name="gold"
//   [0].Arrays[1].PEInfo=[]
//
// A path is made of field names, joined by full stops, and of places in lists, from 0 on, in brackets. A name stands as
// it is unless it could be taken for something else: then it is a JSON string. What is no structure and no list has the
// path "result"; a field of that name is quoted.
#include <string_view>
#include <vector>

#include "Formats.h"
#include "JsonEscapes.h"
#include "MachineWalk.h"
#include "TextBuffer.h"
#include "plexa/JsonText.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

constexpr std::string_view whole = "result";

bool isPlainName(std::string_view name) {
    if (name.empty() || name == whole || name.front() == ' ' || name.back() == ' ' ||
        name.find_first_of(".=[]\"\\") != std::string_view::npos) {
        return false;
    }
    while (!name.empty()) {
        Character const character = takeCharacter(name);
        if (!character.valid || isUnsafeCharacter(character.code)) {
            return false;
        }
    }
    return true;
}

class KeyValueWriter {
public:
    explicit KeyValueWriter(TextBuffer &out)
        : out_(out) {}

    static std::string label(std::string const &name) {
        return isPlainName(name) ? name : jsonText(name);
    }

    void unset() {
        line("null");
    }
    void boolean(bool value) {
        line(value ? "true" : "false");
    }
    void number(int64_t value) {
        path();
        out_.number(value);
        out_.put('\n');
    }
    void text(std::string_view value) {
        path();
        writeJsonText(out_, value);
        out_.put('\n');
    }
    void beginList(std::size_t count) {
        begin(count, "[]");
    }
    void element(std::size_t index) {
        path_.resize(marks_.back());
        path_ += '[';
        path_ += std::to_string(index);
        path_ += ']';
    }
    void endList(std::size_t) {
        end();
    }
    void beginStruct(MetaObj::MetaStruct const &, std::size_t count) {
        begin(count, "{}");
    }
    void field(FieldPlan const &field, std::size_t) {
        path_.resize(marks_.back());
        path_ += path_.empty() ? "" : ".";
        path_ += field.label;
    }
    void endStruct(std::size_t) {
        end();
    }

private:
    void path() {
        out_.append(path_.empty() ? whole : std::string_view(path_));
        out_.put('=');
    }
    void line(std::string_view value) {
        path();
        out_.append(value);
        out_.put('\n');
    }
    void begin(std::size_t count, std::string_view empty) {
        if (count == 0) {
            line(empty);
        }
        marks_.push_back(path_.size());
    }
    void end() {
        path_.resize(marks_.back());
        marks_.pop_back();
    }

    TextBuffer &out_;
    std::string path_;
    std::vector<std::size_t> marks_; // where the paths of the lists and structures around end
};

} // namespace

void writeKeyValue(Result const &result, FormatSettings const &settings, Sink &sink) {
    TextBuffer out(sink);
    KeyValueWriter writer(out);
    MachineWalk("keyvalue", settings, writer).result(result);
}

} // namespace Plexa
