// SPDX-License-Identifier: Apache-2.0
#include "plexa/Declaration.h"

#include "plexa/Text.h"

namespace Plexa {

namespace {

using Object = boost::shared_ptr<MetaObj::MetaObject>;
using Structure = boost::shared_ptr<MetaObj::MetaStruct>;
using Units = std::vector<std::pair<std::string, std::string>>;

std::string valueOf(CallSpec::ParameterType type) {
    switch (type) {
    case CallSpec::String:
    case CallSpec::StringList:
        return "TEXT";
    case CallSpec::Int:
    case CallSpec::IntList:
        return "NUMBER";
    case CallSpec::Bool:
    case CallSpec::BoolList:
        return "true|false";
    case CallSpec::Flag:
        break;
    }
    return {};
}

bool isList(CallSpec::ParameterType type) {
    return type == CallSpec::StringList || type == CallSpec::IntList || type == CallSpec::BoolList;
}

Structure structureOf(Object const &object) {
    return boost::dynamic_pointer_cast<MetaObj::MetaStruct>(object);
}

/// What a value is called; for a list of structures, their structure is set.
std::string kindOf(Object const &object, Structure &elements) {
    if (boost::dynamic_pointer_cast<MetaObj::MetaBool>(object) != nullptr) {
        return "true or false";
    }
    if (boost::dynamic_pointer_cast<MetaObj::MetaInt>(object) != nullptr) {
        return "whole number";
    }
    if (auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(object)) {
        elements = structureOf(list->GetElementSchema());
        if (elements != nullptr) {
            return "list, each element with:";
        }
        return list->GetType() == MetaObj::StructList ? "list" : "list of texts";
    }
    return boost::dynamic_pointer_cast<MetaObj::MetaString>(object) != nullptr ? "text" : "";
}

std::string unitOf(Units const &settings, std::string const &structure, std::string const &field) {
    for (auto const &[key, value] : settings) {
        if (key == "units:" + structure + "." + field) {
            return ", " + value;
        }
    }
    return {};
}

void addFields(DeclaredResult &result, MetaObj::MetaStruct const &structure, Units const &settings, std::size_t depth) {
    for (std::string const &name : structure.GetFieldNames()) {
        Structure elements;
        std::string const kind = kindOf(structure.GetField(name), elements);
        result.fields.push_back({depth, name, kind + unitOf(settings, structure.GetName(), name)});
        if (elements != nullptr) {
            addFields(result, *elements, settings, depth + 1);
        }
    }
}

} // namespace

std::string DeclaredOption::form() const {
    return value.empty() ? name : name + " " + value;
}

std::string DeclaredOption::notes() const {
    return std::string(required ? "Required. " : "") + (repeats ? "May be repeated. " : "") +
           (positional ? "The name may be left out. " : "");
}

std::vector<DeclaredOption> declaredOptions(CallSpec::InputSpec const &spec) {
    std::vector<DeclaredOption> options;
    for (auto const &parameter : spec.GetParameters()) {
        DeclaredOption option;
        option.alias = parameter->GetAlias().empty() ? "" : "-" + parameter->GetAlias();
        option.name = "--" + parameter->GetName();
        option.value = valueOf(parameter->GetType());
        option.required = parameter->IsRequired();
        option.repeats = isList(parameter->GetType());
        option.description = parameter->GetDescription();
        options.push_back(std::move(option));
    }
    return options;
}

std::vector<DeclaredOption> declaredOptions(AutoCli::Command &command) {
    boost::shared_ptr<CallSpec::InputSpec> const spec = command.GetInputSpec();
    std::vector<DeclaredOption> options = spec == nullptr ? std::vector<DeclaredOption>() : declaredOptions(*spec);
    std::string const positional = "--" + command.GetMetaDataField("positional");
    for (DeclaredOption &option : options) {
        option.positional = option.name == positional;
    }
    return options;
}

std::vector<std::string> usagePieces(AutoCli::Command &command, std::string const &program) {
    std::vector<std::string> pieces = {program};
    for (std::string const &word : command.GetPath()) {
        pieces.push_back(word);
    }
    bool optional = false;
    for (DeclaredOption const &option : declaredOptions(command)) {
        if (option.positional) {
            std::string const words = option.value + (option.repeats ? "..." : "");
            pieces.push_back(option.required ? words : "[" + words + "]");
        } else if (option.required) {
            pieces.push_back(option.form());
        } else {
            optional = true;
        }
    }
    if (optional) {
        pieces.emplace_back("[options]");
    }
    return pieces;
}

DeclaredResult declaredResult(AutoCli::Command &command) {
    DeclaredResult result;
    boost::shared_ptr<CallSpec::OutputSpec> const spec = command.GetOutputSpec();
    Object const type = spec == nullptr ? nullptr : spec->GetOutputType();
    Units const settings = command.GetDefaultOutputFormatParameters();
    if (Structure const structure = structureOf(type)) {
        result.what = "a structure with the fields:";
        addFields(result, *structure, settings, 0);
        return result;
    }
    Structure elements;
    result.what = kindOf(type, elements);
    if (elements != nullptr) {
        result.what = "a list, each element with the fields:";
        addFields(result, *elements, settings, 0);
    }
    return result;
}

void appendPieces(std::string &to, std::vector<std::string> const &pieces, std::size_t indent, std::size_t nextIndent,
                  std::size_t width, std::string const &broken) {
    std::string line(indent, ' ');
    bool begun = false;
    for (std::string const &piece : pieces) {
        if (begun && displayWidth(line) + 1 + displayWidth(piece) + broken.size() > width) {
            to += line + broken + "\n";
            line = std::string(nextIndent, ' ');
            begun = false;
        }
        line += (begun ? " " : "") + piece;
        begun = true;
    }
    to += line + "\n";
}

} // namespace Plexa
