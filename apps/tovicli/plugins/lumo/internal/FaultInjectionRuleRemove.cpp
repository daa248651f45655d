// SPDX-License-Identifier: Apache-2.0
#include "FaultInjectionRuleRemove.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "FaultRule.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<FaultInjectionRuleRemove> FaultInjectionRuleRemove::New() {
    return boost::make_shared<FaultInjectionRuleRemove>();
}

FaultInjectionRuleRemove::FaultInjectionRuleRemove() {
    SetDescription("Removes a fault injection rule.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr FaultInjectionRuleRemove::GetInputSpecInternal() {
    return declareParameters({
        {"fault", CallSpec::String, "f", true, "The fault name (e.g. - \"STORAGE_FAULT\")"},
        {"operation", CallSpec::String, "o", false,
         "The Orka op (e.g. - \"createVirtualVolume\") as listed in the Orka 2.0 specification -- omit this parameter "
         "to remove a 'wildcard' rule."},
    });
}

OutputSpecPtr FaultInjectionRuleRemove::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void FaultInjectionRuleRemove::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    CallSession const session("FaultInjectionRuleRemove", 76);
    std::string const fault = input->GetString("fault");
    std::string const operation = readOperation(input);
    bool const done = LumoLib_ModifyFaultInjectionRule(fault.c_str(), operation.c_str(), -1, -1);
    if (!done) {
        output->SetMessage("The injection rule could not be removed.");
    }
    output->SetResult(MetaObj::MetaBool::New(done));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
