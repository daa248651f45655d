// SPDX-License-Identifier: Apache-2.0
#include "FaultRule.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

InputSpecPtr declareTriggerParameters() {
    return declareParameters({
        {"fault", CallSpec::String, "f", true, "The fault name (e.g. - \"STORAGE_FAULT\")"},
        {"operation", CallSpec::String, "o", false,
         "The Orka op (e.g. - \"createVirtualVolume\") as listed in the Orka 2.0 specification -- omit this parameter "
         "to create a 'wildcard' rule which injects this fault for all operations for which it is legal."},
        {"frequency", CallSpec::Int, "n", false,
         "The target frequency in operations.  Either this or time must be specified."},
        {"time", CallSpec::Int, "t", false,
         "The rule will be triggered if time since last injection exceeds this limit (in ms).  Either this or "
         "frequency must be specified."},
    });
}

FaultTrigger readTrigger(InputPtr const &input) {
    FaultTrigger trigger;
    trigger.fault = input->GetString("fault");
    trigger.operation = readOperation(input);
    if (input->HasParameter("frequency")) {
        trigger.frequency = lowWord(input->GetInt("frequency"));
    }
    if (input->HasParameter("time")) {
        trigger.timeMs = lowWord(input->GetInt("time"));
    }
    return trigger;
}

std::string readOperation(InputPtr const &input) {
    return input->HasParameter("operation") ? input->GetString("operation") : "*";
}

} // namespace TarselCli::LumoNamespace
