// SPDX-License-Identifier: Apache-2.0
#include "Describe.h"

#include "Commands.h"
#include "ResultSchema.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

char const *typeName(CallSpec::ParameterType type) {
    switch (type) {
    case CallSpec::String:
        return "string";
    case CallSpec::Int:
        return "integer";
    case CallSpec::Bool:
        return "boolean";
    case CallSpec::Flag:
        return "flag";
    case CallSpec::StringList:
        return "list of strings";
    case CallSpec::IntList:
        return "list of integers";
    case CallSpec::BoolList:
        return "list of booleans";
    }
    return "unknown";
}

void writeTextOrNull(JsonWriter &writer, char const *key, std::string const &text) {
    writer.Key(key);
    if (text.empty()) {
        writer.Null();
    } else {
        writeText(writer, text);
    }
}

void writeParameter(JsonWriter &writer, CallSpec::ParameterSpec const &parameter) {
    writer.StartObject();
    writeTextOrNull(writer, "name", parameter.GetName());
    writeTextOrNull(writer, "alias", parameter.GetAlias());
    writer.Key("type");
    writer.String(typeName(parameter.GetType()));
    writer.Key("required");
    writer.Bool(parameter.IsRequired());
    writeTextOrNull(writer, "description", parameter.GetDescription());
    writer.EndObject();
}

void writeCommand(JsonWriter &writer, KnownCommand const &known) {
    AutoCli::Command &command = *known.command;
    writer.StartObject();
    writeTextOrNull(writer, "path", known.path);
    writeTextOrNull(writer, "description", command.GetDescription());
    writeTextOrNull(writer, "plugin", known.plugin);
    writer.Key("parameters");
    writer.StartArray();
    if (InputSpecPtr const spec = command.GetInputSpec()) {
        for (auto const &parameter : spec->GetParameters()) {
            writeParameter(writer, *parameter);
        }
    }
    writer.EndArray();
    writeTextOrNull(writer, "positional", command.GetMetaDataField("positional"));
    writeTextOrNull(writer, "format", command.GetDefaultOutputFormatter());
    // A result that is a document of its own is printed as it is, in no format of the tool's.
    writer.Key("result");
    if (command.GetMetaDataField("document") == "true") {
        writer.Null();
    } else {
        OutputSpecPtr const spec = command.GetOutputSpec();
        writeResultSchema(writer, spec != nullptr ? spec->GetOutputType() : nullptr);
    }
    writer.EndObject();
}

void writeNamespace(JsonWriter &writer, AutoCli::NamespaceNode &node) {
    writer.StartObject();
    writeTextOrNull(writer, "namespace", node.GetPathString(' '));
    writeTextOrNull(writer, "description", node.GetDescription());
    writer.Key("commands");
    writer.StartArray();
    for (KnownCommand const &known : commandsBelow(node)) {
        writeCommand(writer, known);
    }
    writer.EndArray();
    writer.EndObject();
}

} // namespace

Describe::Describe(CliServices &services)
    : CliCommand(services) {
    SetDescription("Describe a command, or every command of a namespace, as JSON: its parameters, and a JSON Schema "
                   "(2020-12) of its result in the format json.");
    SetMetaDataField("positional", "path");
    SetMetaDataField("document", "true");
    AddExample("cli describe storage internal lumo storagecontainer load", "What the command takes and gives.");
    AddExample("cli describe", "Every command that there is.");
}

InputSpecPtr Describe::GetInputSpecInternal() {
    return declareParameters({
        {"path", CallSpec::StringList, false, "The command's path, word by word; --path may be left out."},
    });
}

OutputSpecPtr Describe::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

void Describe::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::vector<std::string> const path = input->GetStringList("path");
    growAndWarn(services_);
    NodePtr const node = nodeAt(services_.root(), path);
    rapidjson::StringBuffer text;
    JsonWriter writer(text);
    writer.SetIndent(' ', 2);
    if (auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(node)) {
        writeCommand(writer, {command, node->GetPathString(' '), pluginOf(*command)});
    } else {
        writeNamespace(writer, *node);
    }
    output->SetResult(MetaObj::MetaString::New(std::string(text.GetString(), text.GetSize()) + "\n"));
    output->Complete();
}

} // namespace Tovicli::Cli
