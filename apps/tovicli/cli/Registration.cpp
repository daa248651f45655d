// SPDX-License-Identifier: Apache-2.0
#include <boost/make_shared.hpp>

#include "CliServices.h"
#include "CommandList.h"
#include "Complete.h"
#include "CompletionScript.h"
#include "Describe.h"
#include "Doctor.h"
#include "PluginCheck.h"
#include "PluginList.h"
#include "Shell.h"

using namespace Plexa;
using namespace Tovicli::Cli;

namespace {

template <typename Class>
boost::shared_ptr<Class> made(Tovicli::CliServices &services) {
    return boost::make_shared<Class>(services);
}

boost::shared_ptr<AutoCli::Namespace> described(char const *description) {
    auto const node = AutoCli::Namespace::New();
    node->SetDescription(description);
    return node;
}

} // namespace

void Tovicli_RegisterCli(boost::shared_ptr<AutoCli::NamespaceNode> const &cli, Tovicli::CliServices &services,
                         bool completing) {
    auto const command = described("The commands of the tool.");
    command->RegisterNamespaceNode(made<CommandList>(services), "list");
    cli->RegisterNamespaceNode(command, "command");

    cli->RegisterNamespaceNode(made<Describe>(services), "describe");

    auto const plugin = described("The plug-ins that commands come from.");
    plugin->RegisterNamespaceNode(made<PluginList>(services), "list");
    plugin->RegisterNamespaceNode(made<PluginCheck>(services), "check");
    cli->RegisterNamespaceNode(plugin, "plugin");

    cli->RegisterNamespaceNode(made<CompletionScript>(services), "completion");
    cli->RegisterNamespaceNode(made<Doctor>(services), "doctor");
    cli->RegisterNamespaceNode(made<Shell>(services), "shell");
    if (completing) { // nobody else's business
        cli->RegisterNamespaceNode(made<Complete>(services), "complete");
    }
}
