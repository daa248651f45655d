// SPDX-License-Identifier: Apache-2.0
#include "plexa/TreeHelp.h"

#include "plexa/OptionTable.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

void appendChildren(std::string &help, AutoCli::NamespaceNode &node, char const *type, char const *title,
                    std::size_t width) {
    std::vector<OptionRow> rows;
    for (auto const &child : node.GetNamespaceNodes()) {
        if (child->GetType() == type) {
            rows.push_back({child->GetName(), child->GetDescription()});
        }
    }
    if (!rows.empty()) {
        help += title;
        appendOptionTable(help, rows, width);
    }
}

} // namespace

std::string namespaceHelp(AutoCli::NamespaceNode &node, std::string const &program, std::size_t width) {
    std::string const path = node.GetPathString(' ');
    std::string help = "Usage:\n  " + program + (path.empty() ? " [global options] NAMESPACE..." : " " + path);
    help += " COMMAND [options]\n";
    if (!node.GetDescription().empty()) {
        help += '\n';
        appendWrapped(help, node.GetDescription(), 0, width);
    }
    appendChildren(help, node, "namespace", "\nNamespaces:\n", width);
    appendChildren(help, node, "command", "\nCommands:\n", width);
    return help;
}

std::string commandHelpText(AutoCli::Command &command, std::string const &program, std::size_t width) {
    auto const input = CallSpec::Input::New();
    input->SetString("program", program);
    input->SetInt("width", static_cast<int64_t>(width));
    auto const output = CallSpec::Output::New();
    command.GenerateHelpOutput(input, output);
    auto const text = boost::dynamic_pointer_cast<MetaObj::MetaString>(output->GetResult());
    return text != nullptr ? text->GetValue() : std::string();
}

std::string globalOptionsHelp(CallSpec::InputSpec const &options, std::size_t width) {
    std::string help = "\nGlobal options:\n";
    appendDeclaredOptions(help, declaredOptions(options), width);
    return help;
}

} // namespace Plexa
