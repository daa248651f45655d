// SPDX-License-Identifier: Apache-2.0
#include "CommandList.h"

#include "Commands.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

StructPtr commandStructure() {
    return textStructure("Command", {"Path", "Description", "Plugin"});
}

} // namespace

CommandList::CommandList(CliServices &services)
    : CliCommand(services) {
    SetDescription("List every command: its path, what it does, and the plug-in that it comes from.");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns", "Path,Description,Plugin");
}

InputSpecPtr CommandList::GetInputSpecInternal() {
    return declareParameters({});
}

OutputSpecPtr CommandList::GetOutputSpecInternal() {
    return declareResult(makeStructList(commandStructure()));
}

void CommandList::ExecuteInternal(InputPtr const &, OutputPtr const &output) {
    growAndWarn(services_);
    ListPtr const list = makeStructList(commandStructure());
    for (KnownCommand const &known : commandsBelow(*services_.root())) {
        StructPtr const row = commandStructure();
        row->SetField("Path", known.path);
        row->SetField("Description", known.command->GetDescription());
        if (!known.plugin.empty()) {
            row->SetField("Plugin", known.plugin);
        }
        list->Append(row);
    }
    output->SetResult(list);
    output->Complete();
}

} // namespace Tovicli::Cli
