// SPDX-License-Identifier: Apache-2.0
#include "PluginCheck.h"

#include "plugins/Directory.h"
#include "plugins/Inspection.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

StructPtr findingStructure() {
    return textStructure("Finding", {"File", "Check", "Detail"});
}

} // namespace

PluginCheck::PluginCheck(CliServices &services)
    : CliCommand(services) {
    SetDescription("Check whether the tool would use a plug-in; everything that keeps it from that is a row. The file "
                   "is loaded, in a process of its own, once nothing else speaks against it.");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns", "Check,Detail");
}

InputSpecPtr PluginCheck::GetInputSpecInternal() {
    return declareParameters({
        {"file", CallSpec::String, true, "The plug-in's file."},
    });
}

OutputSpecPtr PluginCheck::GetOutputSpecInternal() {
    return declareResult(makeStructList(findingStructure()));
}

void PluginCheck::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const file = input->GetString("file");
    Settings const &settings = services_.settings();
    Question const question{file, loadedBefore(file, settings.pluginDirectory), installedLibraries(),
                            std::chrono::milliseconds(settings.timeoutMs)};
    std::vector<Finding> const findings = inspect(question);
    ListPtr const list = makeStructList(findingStructure());
    for (Finding const &finding : findings) {
        StructPtr const row = findingStructure();
        row->SetField("File", file);
        row->SetField("Check", finding.check);
        row->SetField("Detail", finding.detail);
        list->Append(row);
    }
    output->SetResult(list);
    if (findings.empty()) {
        output->Complete();
    } else {
        output->SetMessage("the plug-in '" + file + "' would not be used: " + std::to_string(findings.size()) +
                           (findings.size() == 1 ? " finding" : " findings"));
    }
}

} // namespace Tovicli::Cli
