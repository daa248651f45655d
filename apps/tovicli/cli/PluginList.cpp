// SPDX-License-Identifier: Apache-2.0
#include "PluginList.h"

#include <algorithm>

#include "plugins/Directory.h"
#include "plugins/Inspection.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

StructPtr pluginStructure() {
    return textStructure("Plugin", {"File", "State", "ABI", "Reason"});
}

/// What the registration says about one file: "plug-in 'name' skipped: reason".
std::string troubleOf(std::string const &name, Registration const &registration, std::string const &kind) {
    std::string const begin = "plug-in '" + name + "' " + kind + ": ";
    for (std::string const &trouble : registration.troubles) {
        if (trouble.starts_with(begin)) {
            return trouble.substr(begin.size());
        }
    }
    return {};
}

} // namespace

PluginList::PluginList(CliServices &services)
    : CliCommand(services) {
    SetDescription("List the files of the plug-in directory: whether each is loaded, what it was built against, and "
                   "why it is not used.");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns", "File,State,ABI,Reason");
}

InputSpecPtr PluginList::GetInputSpecInternal() {
    return declareParameters({});
}

OutputSpecPtr PluginList::GetOutputSpecInternal() {
    return declareResult(makeStructList(pluginStructure()));
}

void PluginList::ExecuteInternal(InputPtr const &, OutputPtr const &output) {
    Registration const &registration = services_.growPlugins();
    std::string const &directory = services_.settings().pluginDirectory;
    ListPtr const list = makeStructList(pluginStructure());
    for (std::string const &file : pluginFiles(directory)) {
        std::string const name = file.substr(file.rfind('/') + 1);
        std::string const skipped = troubleOf(name, registration, "skipped");
        std::string const failed = troubleOf(name, registration, "failed");
        bool const registered = std::any_of(registration.plugins.begin(), registration.plugins.end(),
                                            [&name](RegisteredPlugin const &plugin) { return plugin.name == name; });
        StructPtr const row = pluginStructure();
        row->SetField("File", file);
        row->SetField("State", !failed.empty() ? "failed" : registered ? "loaded" : "skipped");
        if (std::string const abi = abiOf(file); !abi.empty()) {
            row->SetField("ABI", abi);
        }
        if (!failed.empty() || !registered) {
            row->SetField("Reason", !failed.empty()    ? failed
                                    : !skipped.empty() ? skipped
                                                       : std::string("nothing is loaded from its directory"));
        }
        list->Append(row);
    }
    for (std::string const &trouble : registration.troubles) {
        if (!trouble.starts_with("plug-in '")) {
            services_.warn(trouble); // about the directory; the others stand in the rows
        }
    }
    output->SetResult(list);
    output->Complete();
}

} // namespace Tovicli::Cli
