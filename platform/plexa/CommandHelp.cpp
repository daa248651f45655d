// SPDX-License-Identifier: Apache-2.0
#include "CommandHelp.h"

#include <algorithm>

#include "plexa/OptionTable.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

using CallSpec::ParameterSpec;
using Parameters = std::vector<boost::shared_ptr<ParameterSpec>>;

/// What stands for the value in a usage line; empty for a flag.
std::string placeholder(CallSpec::ParameterType type) {
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

std::string longForm(ParameterSpec const &parameter) {
    std::string form = "--" + parameter.GetName();
    std::string const value = placeholder(parameter.GetType());
    return value.empty() ? form : form + " " + value;
}

std::string usageLine(AutoCli::Command &command, std::string const &program, Parameters const &parameters) {
    std::string line = program + " " + command.GetPathString(' ');
    bool optional = false;
    for (auto const &parameter : parameters) {
        if (parameter->IsRequired()) {
            line += " " + longForm(*parameter);
        } else {
            optional = true;
        }
    }
    return optional ? line + " [options]" : line;
}

void appendOptions(std::string &help, Parameters const &parameters, std::size_t width) {
    std::vector<OptionRow> rows;
    for (auto const &parameter : parameters) {
        std::string note = parameter->IsRequired() ? "Required. " : "";
        if (isList(parameter->GetType())) {
            note += "May be repeated. ";
        }
        std::string const alias = parameter->GetAlias().empty() ? "    " : "-" + parameter->GetAlias() + ", ";
        rows.push_back({alias + longForm(*parameter), note + parameter->GetDescription()});
    }
    help += "\nOptions:\n";
    appendOptionTable(help, rows, width);
}

/// "StorageContainer Name, ..., Arrays (ArrayId, ...)": names that --fields and scripts use.
std::string fieldList(MetaObj::MetaStruct const &structure) {
    std::string names;
    for (std::string const &name : structure.GetFieldNames()) {
        names += names.empty() ? name : ", " + name;
        auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(structure.GetField(name));
        auto const nested = list == nullptr
                                ? boost::shared_ptr<MetaObj::MetaStruct>()
                                : boost::dynamic_pointer_cast<MetaObj::MetaStruct>(list->GetElementSchema());
        if (nested != nullptr) {
            names += " (" + fieldList(*nested) + ")";
        }
    }
    return names;
}

void appendResult(std::string &help, AutoCli::Command &command, std::size_t width) {
    boost::shared_ptr<CallSpec::OutputSpec> const spec = command.GetOutputSpec();
    boost::shared_ptr<MetaObj::MetaObject> type = spec == nullptr ? nullptr : spec->GetOutputType();
    bool several = false;
    if (auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(type)) {
        several = true;
        type = list->GetElementSchema();
    }
    auto const structure = boost::dynamic_pointer_cast<MetaObj::MetaStruct>(type);
    if (structure == nullptr) {
        return;
    }
    help += several ? "\nFields of each element of the result:\n" : "\nFields of the result:\n";
    appendWrapped(help, fieldList(*structure), 2, width);
}

} // namespace

std::string commandHelp(AutoCli::Command &command, boost::shared_ptr<CallSpec::Input> const &input) {
    bool const hasProgram = input != nullptr && input->HasParameter("program");
    bool const hasWidth = input != nullptr && input->HasParameter("width") && input->GetInt("width") > 0;
    std::string const program = hasProgram ? input->GetString("program") : "tovicli";
    std::size_t const width = hasWidth ? static_cast<std::size_t>(input->GetInt("width")) : 80;

    boost::shared_ptr<CallSpec::InputSpec> const spec = command.GetInputSpec();
    Parameters const parameters = spec == nullptr ? Parameters() : spec->GetParameters();

    std::string help = "Usage:\n";
    appendWrapped(help, usageLine(command, program, parameters), 2, width);
    if (!command.GetDescription().empty()) {
        help += '\n';
        appendWrapped(help, command.GetDescription(), 0, width);
    }
    if (!parameters.empty()) {
        appendOptions(help, parameters, width);
    }
    appendResult(help, command, width);
    auto const examples = command.GetExamples();
    if (!examples.empty()) {
        help += "\nExamples:\n";
        for (auto const &example : examples) {
            help += "  " + example.first + "\n";
            appendWrapped(help, example.second, 6, width);
        }
    }
    return help;
}

} // namespace Plexa
