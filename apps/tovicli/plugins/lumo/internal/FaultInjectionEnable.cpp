// SPDX-License-Identifier: Apache-2.0
#include "FaultInjectionEnable.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<FaultInjectionEnable> FaultInjectionEnable::New() {
    return boost::make_shared<FaultInjectionEnable>();
}

FaultInjectionEnable::FaultInjectionEnable() {
    SetDescription("Enable or disable Orka Fault Injection.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr FaultInjectionEnable::GetInputSpecInternal() {
    return declareParameters({
        {"enabled", CallSpec::Bool, "e", true, "true / false"},
    });
}

OutputSpecPtr FaultInjectionEnable::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void FaultInjectionEnable::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    CallSession const session("FaultInjectionEnable", 68);
    if (!LumoLib_SetFaultInjectionEnabled(input->GetBool("enabled"))) {
        output->SetMessage("Failed to change the fault injection status.");
        return;
    }
    output->SetResult(MetaObj::MetaBool::New(true));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
