// SPDX-License-Identifier: Apache-2.0
#include "Doctor.h"

#include <algorithm>

#include "doctor/DaemonChecks.h"
#include "doctor/Directories.h"
#include "doctor/ProviderChecks.h"
#include "doctor/StoreView.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

/// Another process may hold the store's lock for a moment.
constexpr std::chrono::milliseconds longestWait{1000};

StructPtr checkStructure() {
    return textStructure("Check", {"Check", "State", "Detail"});
}

char const *nameOf(State state) {
    return state == State::Ok ? "ok" : state == State::Warn ? "warn" : "fail";
}

Report examine(CliServices &services) {
    Settings const &settings = services.settings();
    std::chrono::milliseconds const timeout(settings.timeoutMs);
    Report report;
    if (!checkRoot(settings.root, report)) {
        return report; // everything else lies below it
    }
    std::optional<StoreView> const view = checkStore(settings.root, std::min(timeout, longestWait), report);
    std::optional<Served> const served =
        checkDaemon({settings.root, timeout, services.version(), services.isOffline(), !services.isLine()}, report);
    if (view) {
        checkMounts(settings.root, *view, report);
        checkProviders(*view, served, report);
    }
    return report;
}

} // namespace

Doctor::Doctor(CliServices &services)
    : CliCommand(services) {
    SetDescription("Look over the host: root, store, daemon, mounts, providers. One line a check: ok, warn or fail. "
                   "Nothing is changed; the status is 1 when a check fails.");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns", "Check,State,Detail");
}

InputSpecPtr Doctor::GetInputSpecInternal() {
    return declareParameters({});
}

OutputSpecPtr Doctor::GetOutputSpecInternal() {
    return declareResult(makeStructList(checkStructure()));
}

void Doctor::ExecuteInternal(InputPtr const &, OutputPtr const &output) {
    Report const report = examine(services_);
    ListPtr const list = makeStructList(checkStructure());
    std::size_t failed = 0;
    for (Check const &check : report.checks()) {
        failed += check.state == State::Fail ? 1 : 0;
        StructPtr const row = checkStructure();
        row->SetField("Check", check.name);
        row->SetField("State", nameOf(check.state));
        row->SetField("Detail", check.detail);
        list->Append(row);
    }
    output->SetResult(list);
    if (failed == 0) {
        output->Complete();
    } else {
        output->SetMessage(std::to_string(failed) + " of " + std::to_string(report.checks().size()) + " checks failed");
    }
}

} // namespace Tovicli::Cli
