// SPDX-License-Identifier: Apache-2.0
#include "FaultInjectionRuleAdd.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "FaultRule.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<FaultInjectionRuleAdd> FaultInjectionRuleAdd::New() {
    return boost::make_shared<FaultInjectionRuleAdd>();
}

FaultInjectionRuleAdd::FaultInjectionRuleAdd() {
    SetDescription("Add a fault injection rule.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr FaultInjectionRuleAdd::GetInputSpecInternal() {
    return declareTriggerParameters();
}

OutputSpecPtr FaultInjectionRuleAdd::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void FaultInjectionRuleAdd::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    CallSession const session("FaultInjectionRuleAdd", 93);
    FaultTrigger const trigger = readTrigger(input);
    if (!trigger.isGiven()) {
        output->SetMessage("You must specify either a frequency or a maximum time to add a rule.");
        return;
    }
    bool const done = LumoLib_AddFaultInjectionRule(trigger.fault.c_str(), trigger.operation.c_str(), trigger.frequency,
                                                    trigger.timeMs);
    if (!done) {
        output->SetMessage("The injection rule could not be added.");
    }
    output->SetResult(MetaObj::MetaBool::New(done));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
