// SPDX-License-Identifier: Apache-2.0
#include <rapidjson/prettywriter.h>

#include "Formats.h"
#include "ResultModel.h"
#include "TextBuffer.h"
#include "plexa/JsonText.h"

namespace Plexa {

using namespace MetaObj;

namespace {

/// What RapidJSON's writers write to.
class JsonStream {
public:
    using Ch = char;
    explicit JsonStream(Sink &sink)
        : buffer_(sink) {}
    void Put(char c) {
        buffer_.put(c);
    }
    void Flush() {}

private:
    TextBuffer buffer_;
};

class JsonWriter {
public:
    JsonWriter(FormatSettings const &settings, Sink &sink)
        : outermost_(settings, [&settings](std::string const &) { return settings.chosenFields(); })
        , nested_(settings, [](std::string const &) { return std::nullopt; })
        , stream_(sink)
        , writer_(stream_) {
        writer_.SetIndent(' ', 2);
    }

    void document(Result const &result) {
        value(result.value, result.schema, true);
        stream_.Put('\n');
    }

private:
    void value(Object const &value, Object const &schema, bool outermost) {
        if (!isSet(value)) {
            writer_.Null();
        } else if (auto const *list = dynamic_cast<MetaList const *>(value.get())) {
            Object const element = elementSchema(value, schema);
            writer_.StartArray();
            for (Object const &each : list->GetElements()) {
                this->value(each, element, outermost);
            }
            writer_.EndArray();
        } else if (auto const *made = dynamic_cast<MetaStruct const *>(value.get())) {
            structure(*made, schema, outermost ? outermost_ : nested_);
        } else if (auto const *number = dynamic_cast<MetaInt const *>(value.get())) {
            writer_.Int64(number->GetValue());
        } else if (auto const *truth = dynamic_cast<MetaBool const *>(value.get())) {
            writer_.Bool(truth->GetValue());
        } else {
            text(scalarText(value));
        }
    }

    void structure(MetaStruct const &structure, Object const &schema, StructurePlans &plans) {
        std::shared_ptr<StructurePlan const> const plan = plans.planOf(structure, schema);
        writer_.StartObject();
        for (FieldPlan const &field : *plan) {
            text(field.name);
            value(structure.GetField(field.name), field.schema, false);
        }
        writer_.EndObject();
    }

    void text(std::string const &text) {
        std::string const json = jsonText(text);
        writer_.RawValue(json.data(), json.size(), rapidjson::kStringType);
    }

    StructurePlans outermost_; // of these alone the user chooses fields
    StructurePlans nested_;
    JsonStream stream_;
    rapidjson::PrettyWriter<JsonStream> writer_;
};

} // namespace

void writeJson(Result const &result, FormatSettings const &settings, Sink &sink) {
    JsonWriter(settings, sink).document(result);
}

} // namespace Plexa
