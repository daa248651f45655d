// SPDX-License-Identifier: Apache-2.0
#include "ResultSchema.h"

#include "plexa/JsonText.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

/// Whether null stands for a value that was not set: inside a structure, where every field appears.
enum class Unset { IsNull, Cannot };

void writeSchema(JsonWriter &writer, ObjectPtr const &declared, Unset unset);

void writeType(JsonWriter &writer, char const *type, Unset unset) {
    writer.Key("type");
    if (unset == Unset::Cannot) {
        writer.String(type);
        return;
    }
    writer.StartArray();
    writer.String(type);
    writer.String("null");
    writer.EndArray();
}

void writeStructure(JsonWriter &writer, MetaObj::MetaStruct const &structure) {
    writer.Key("title");
    writeText(writer, structure.GetName());
    writeType(writer, "object", Unset::Cannot);
    writer.Key("properties");
    writer.StartObject();
    for (std::string const &field : structure.GetFieldNames()) {
        writeText(writer, field);
        writeSchema(writer, structure.GetField(field), Unset::IsNull);
    }
    writer.EndObject();
    writer.Key("required");
    writer.StartArray();
    for (std::string const &field : structure.GetFieldNames()) {
        writeText(writer, field);
    }
    writer.EndArray();
    writer.Key("additionalProperties");
    writer.Bool(false);
}

void writeInteger(JsonWriter &writer, Unset unset) {
    writeType(writer, "integer", unset);
    writer.Key("minimum");
    writer.Int64(INT64_MIN);
    writer.Key("maximum");
    writer.Int64(INT64_MAX);
}

void writeList(JsonWriter &writer, MetaObj::MetaList const &list) {
    writeType(writer, "array", Unset::Cannot);
    writer.Key("items");
    if (list.GetElementSchema() != nullptr) {
        writeSchema(writer, list.GetElementSchema(), Unset::Cannot);
        return;
    }
    writer.StartObject();
    switch (list.GetType()) {
    case MetaObj::StringList:
        writeType(writer, "string", Unset::Cannot);
        break;
    case MetaObj::Int:
        writeInteger(writer, Unset::Cannot);
        break;
    case MetaObj::Bool:
        writeType(writer, "boolean", Unset::Cannot);
        break;
    case MetaObj::StructList:
        writeType(writer, "object", Unset::Cannot); // of fields that the command does not declare
        break;
    }
    writer.EndObject();
}

void writeMembers(JsonWriter &writer, ObjectPtr const &declared, Unset unset) {
    if (auto const structure = boost::dynamic_pointer_cast<MetaObj::MetaStruct>(declared)) {
        writeStructure(writer, *structure);
    } else if (auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(declared)) {
        writeList(writer, *list);
    } else if (boost::dynamic_pointer_cast<MetaObj::MetaBool>(declared)) {
        writeType(writer, "boolean", unset);
    } else if (boost::dynamic_pointer_cast<MetaObj::MetaInt>(declared)) {
        writeInteger(writer, unset);
    } else if (boost::dynamic_pointer_cast<MetaObj::MetaString>(declared)) {
        writeType(writer, "string", unset);
    }
}

void writeSchema(JsonWriter &writer, ObjectPtr const &declared, Unset unset) {
    writer.StartObject();
    writeMembers(writer, declared, unset);
    writer.EndObject();
}

} // namespace

void writeText(JsonWriter &writer, std::string const &text) {
    std::string const quoted = jsonText(text);
    writer.RawValue(quoted.data(), quoted.size(), rapidjson::kStringType);
}

void writeResultSchema(JsonWriter &writer, ObjectPtr const &result) {
    writer.StartObject();
    writer.Key("$schema");
    writer.String("https://json-schema.org/draft/2020-12/schema");
    writeMembers(writer, result, Unset::Cannot);
    writer.EndObject();
}

} // namespace Tovicli::Cli
