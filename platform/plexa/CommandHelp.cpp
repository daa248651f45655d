// SPDX-License-Identifier: Apache-2.0
#include "CommandHelp.h"

#include "plexa/Declaration.h"
#include "plexa/OptionTable.h"
#include "plexa/Text.h"

namespace Plexa {

namespace {

void appendResult(std::string &help, AutoCli::Command &command, std::size_t width) {
    DeclaredResult const result = declaredResult(command);
    if (result.what.empty()) {
        return;
    }
    help += "\nResult: " + result.what + "\n";
    std::vector<OptionRow> rows;
    for (DeclaredField const &field : result.fields) {
        rows.push_back({std::string(2 * field.depth, ' ') + field.name, field.kind});
    }
    appendOptionTable(help, rows, width);
}

} // namespace

std::string commandHelp(AutoCli::Command &command, boost::shared_ptr<CallSpec::Input> const &input) {
    bool const hasProgram = input != nullptr && input->HasParameter("program");
    bool const hasWidth = input != nullptr && input->HasParameter("width") && input->GetInt("width") > 0;
    std::string const program = hasProgram ? input->GetString("program") : "tovicli";
    std::size_t const width = hasWidth ? static_cast<std::size_t>(input->GetInt("width")) : 80;

    std::string help = "Usage:\n";
    appendPieces(help, usagePieces(command, program), 2, 6, width);
    if (!command.GetDescription().empty()) {
        help += '\n';
        appendWrapped(help, command.GetDescription(), 0, width);
    }
    std::vector<DeclaredOption> const options = declaredOptions(command);
    if (!options.empty()) {
        help += "\nOptions:\n";
        appendDeclaredOptions(help, options, width);
    }
    appendResult(help, command, width);
    auto const examples = command.GetExamples();
    if (!examples.empty()) {
        help += "\nExamples:\n";
        for (auto const &example : examples) {
            appendWrapped(help, example.second, 2, width);
            bool const whole = example.first.starts_with(program + " ");
            help += "      " + (whole ? "" : program + " ") + example.first + "\n";
        }
    }
    return help;
}

} // namespace Plexa
