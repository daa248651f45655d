// SPDX-License-Identifier: Apache-2.0
#include "DaemonCommand.h"

#include <algorithm>
#include <cctype>
#include <optional>
#include <string_view>
#include <vector>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "DaemonText.h"
#include "kestrel/Storage.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<DaemonCommand> DaemonCommand::New() {
    return boost::make_shared<DaemonCommand>();
}

DaemonCommand::DaemonCommand() {
    SetDescription("Daemon Command for lumo Operations.");
    SetMetaDataField("type", "operation");
    openSession("DaemonCommand", 38);
}

DaemonCommand::~DaemonCommand() {
    closeSession();
}

InputSpecPtr DaemonCommand::GetInputSpecInternal() {
    return declareParameters({
        {"log-level", CallSpec::String, "l", false,
         "log-level <panic|quiet|error|warning|verbose|trivia> log-level is not changed if parameter is omitted"},
        {"dump-objects", CallSpec::Flag, "d", false,
         "Dump Lumo daemon memory objects to the logdumping of dameon memory is not done if parameter is omitted"},
        {"unbind-period", CallSpec::Int, "t", false,
         "Unbind timer interval in microseconds. Unbind Timer interval is defaulted to 5 mins if parameter is omitted"},
        {"unbind-now", CallSpec::Flag, "u", false,
         "Set this flag to force unbind now. Unbind will happen on the timer if parameter is omitted"},
        {"start-pe-apd", CallSpec::String, nullptr, false,
         "Simulate PE APD start for a given PE. APD simulation is not done if omitted "},
        {"end-pe-apd", CallSpec::String, nullptr, false,
         "Simulate PE APD end for a given PE. APD simulation is not done if omitted "},
        {"disable-spm-space-efficiency-cmds", CallSpec::Bool, nullptr, false,
         "Disable space efficiency capability commands in SPM. This means that Lumo Layer will not modify profile "
         "based on alloctype."},
    });
}

OutputSpecPtr DaemonCommand::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

namespace {

/// Without regard to case. Boost's way of asking sets up a locale, which takes as long as the whole request.
bool isSameWord(std::string_view left, std::string_view right) {
    auto const lower = [](char c) { return std::tolower(static_cast<unsigned char>(c)); };
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [&](char a, char b) { return lower(a) == lower(b); });
}

} // namespace

unsigned DaemonCommand::GetLogLevelInt(std::string keyword) {
    struct Level {
        char const *keyword;
        unsigned number;
    };
    // Each number is one bit of the daemon's mask; "quiet" stands below "panic" there.
    static constexpr Level levels[] = {{"panic", 2}, {"quiet", 1},    {"error", 4},  {"warning", 8},
                                       {"info", 16}, {"verbose", 32}, {"trivia", 64}};
    for (Level const &level : levels) {
        if (isSameWord(keyword, level.keyword)) {
            return level.number;
        }
    }
    return 4;
}

namespace {

using Gantry::Storage::ProtocolEndPointEvent;

void notifyEndpoint(Kestrel::Storage::StorageInfoImpl &host, OutputPtr const &output, std::string const &endpoint,
                    ProtocolEndPointEvent event) {
    std::vector<std::string> containers;
    host.NotifyLumoProtocolEndpointEvent(endpoint, event, containers);
    std::string text = "Notify PE APD command returned containers: ";
    for (std::string const &container : containers) {
        text += container + ", ";
    }
    output->SetMessage(text + ".\n");
}

int32_t const *address(std::optional<int32_t> const &value) {
    return value ? &*value : nullptr;
}

/// Empty when neither unbinding at once nor a period was asked for.
std::optional<int32_t> readUnbindPeriod(InputPtr const &input) {
    if (input->GetBool("unbind-now")) {
        return 0;
    }
    if (input->HasParameter("unbind-period")) {
        return lowWord(input->GetInt("unbind-period"));
    }
    return std::nullopt;
}

} // namespace

void DaemonCommand::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::optional<int32_t> logLevel;
    if (input->HasParameter("log-level")) {
        logLevel = static_cast<int32_t>(GetLogLevelInt(input->GetString("log-level")));
    }
    std::optional<int32_t> dump;
    if (input->GetBool("dump-objects")) {
        dump = 1;
    }
    std::optional<int32_t> const unbindPeriod = readUnbindPeriod(input);

    // The first of these that is asked for is all that is done.
    if (input->HasParameter("start-pe-apd")) {
        notifyEndpoint(host, output, input->GetString("start-pe-apd"), ProtocolEndPointEvent::ApdStart);
    } else if (input->HasParameter("end-pe-apd")) {
        notifyEndpoint(host, output, input->GetString("end-pe-apd"), ProtocolEndPointEvent::ApdEnd);
    } else if (input->HasParameter("disable-spm-space-efficiency-cmds")) {
        bool const enabled = !input->GetBool("disable-spm-space-efficiency-cmds");
        reportOutcome(output, "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled failed with error, ",
                      LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(enabled ? 1 : 0));
        output->Complete();
    } else if (!logLevel && !dump && !unbindPeriod) {
        output->SetMessage("At least one of the parameters --log-level, --dump-objects, --unbind-period, --unbind-now, "
                           "--start-pe-apd, --end-pe-apd, --disable-spm-space-efficiency-cmds is needed");
    } else {
        reportOutcome(output, "LumoLib_DebugCommand  failed with error ",
                      LumoLib_DebugCommand(address(logLevel), address(dump), address(unbindPeriod)));
        output->Complete();
    }
}

} // namespace TarselCli::LumoNamespace
