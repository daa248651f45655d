// SPDX-License-Identifier: Apache-2.0
#include "Help.h"

#include "Examples.h"
#include "ExitStatus.h"
#include "Settings.h"
#include "plexa/Declaration.h"
#include "plexa/OptionTable.h"
#include "plexa/Text.h"
#include "plexa/TreeHelp.h"

namespace Tovicli {

using namespace Plexa;

namespace {

void appendExamples(std::string &help, AutoCli::Command &command, std::string const &program, std::size_t width) {
    if (!command.GetExamples().empty()) {
        return; // the framework has shown them
    }
    std::vector<Example> const examples = examplesOf(command, program);
    if (!examples.empty()) {
        help += "\nExamples:\n";
    }
    for (Example const &example : examples) {
        appendWrapped(help, example.purpose, 2, width);
        appendPieces(help, example.pieces, 6, 8, width, " \\");
    }
}

/// Their names; what they mean is told once, by the tool's own help.
void appendGlobalNames(std::string &help, std::string const &program, std::size_t width) {
    std::vector<std::string> names;
    for (DeclaredOption const &option : declaredOptions(*globalOptions())) {
        names.push_back((option.alias.empty() ? "" : option.alias + ", ") + option.form() + ",");
    }
    names.back().pop_back();
    help += "\nGlobal options, as '" + program + " --help' tells them:\n";
    appendPieces(help, names, 2, 2, width);
}

void appendStatuses(std::string &help, std::size_t width) {
    std::vector<OptionRow> rows;
    for (ExitMeaning const &each : exitMeanings) {
        rows.push_back({each.status, each.meaning});
    }
    help += "\nExit status:\n";
    appendOptionTable(help, rows, width);
}

} // namespace

std::string helpOf(AutoCli::NamespaceNode &node, std::string const &program, std::size_t width) {
    auto *const command = dynamic_cast<AutoCli::Command *>(&node);
    std::string help =
        command != nullptr ? commandHelpText(*command, program, width) : namespaceHelp(node, program, width);
    if (command != nullptr) {
        appendExamples(help, *command, program, width);
    }
    if (node.GetParent() == nullptr) {
        help += globalOptionsHelp(*globalOptions(), width);
    } else {
        appendGlobalNames(help, program, width);
    }
    if (command != nullptr || node.GetParent() == nullptr) {
        appendStatuses(help, width);
    }
    return help;
}

} // namespace Tovicli
