// SPDX-License-Identifier: Apache-2.0
#include "FaultInjectionRuleSet.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "FaultRule.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<FaultInjectionRuleSet> FaultInjectionRuleSet::New() {
    return boost::make_shared<FaultInjectionRuleSet>();
}

FaultInjectionRuleSet::FaultInjectionRuleSet() {
    SetDescription("Modify a fault injection rule.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr FaultInjectionRuleSet::GetInputSpecInternal() {
    return declareTriggerParameters();
}

OutputSpecPtr FaultInjectionRuleSet::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void FaultInjectionRuleSet::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    CallSession const session("FaultInjectionRuleSet", 93);
    FaultTrigger const trigger = readTrigger(input);
    if (!trigger.isGiven()) {
        output->SetMessage("You must specify either a frequency or a maximum time to modify a rule.");
        return;
    }
    bool const done = LumoLib_ModifyFaultInjectionRule(trigger.fault.c_str(), trigger.operation.c_str(),
                                                       trigger.frequency, trigger.timeMs);
    if (!done) {
        output->SetMessage("The injection rule could not be modified.  Verify that the rule exists.");
    }
    output->SetResult(MetaObj::MetaBool::New(done));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
