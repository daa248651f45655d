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
        : chosen_(settings.chosenFields())
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
        } else if (dynamic_cast<MetaStruct const *>(value.get()) != nullptr) {
            structure(value, schema, outermost);
        } else if (auto const *number = dynamic_cast<MetaInt const *>(value.get())) {
            writer_.Int64(number->GetValue());
        } else if (auto const *truth = dynamic_cast<MetaBool const *>(value.get())) {
            writer_.Bool(truth->GetValue());
        } else {
            text(scalarText(value));
        }
    }

    void structure(Object const &value, Object const &schema, bool outermost) {
        std::vector<FieldView> fields = fieldsOf(value, schema);
        if (outermost && chosen_) {
            fields = selected(fields, *chosen_);
        }
        writer_.StartObject();
        for (FieldView const &field : fields) {
            text(field.name);
            this->value(field.value, field.schema, false);
        }
        writer_.EndObject();
    }

    void text(std::string const &text) {
        std::string const json = jsonText(text);
        writer_.RawValue(json.data(), json.size(), rapidjson::kStringType);
    }

    std::optional<std::vector<std::string>> chosen_;
    JsonStream stream_;
    rapidjson::PrettyWriter<JsonStream> writer_;
};

} // namespace

void writeJson(Result const &result, FormatSettings const &settings, Sink &sink) {
    JsonWriter(settings, sink).document(result);
}

} // namespace Plexa
