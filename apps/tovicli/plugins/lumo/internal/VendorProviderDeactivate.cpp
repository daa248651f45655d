// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderDeactivate.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "DaemonText.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderDeactivate> VendorProviderDeactivate::New() {
    return boost::make_shared<VendorProviderDeactivate>();
}

VendorProviderDeactivate::VendorProviderDeactivate() {
    SetDescription("Deactivate Orka Provider for a specified Array.");
    SetMetaDataField("type", "operation");
    openSession("VendorProviderDeactivate", 36);
}

VendorProviderDeactivate::~VendorProviderDeactivate() {
    closeSession();
}

InputSpecPtr VendorProviderDeactivate::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "n", true, "Name of the VP to be deactivated"},
        {"arrayid", CallSpec::String, "a", true, "ID of the Array to be Deactivated"},
    });
}

OutputSpecPtr VendorProviderDeactivate::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void VendorProviderDeactivate::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const arrayId = input->GetString("arrayid");
    std::string const name = input->GetString("vp-name");
    int32_t const code = LumoLib_DeactivateProvider(arrayId.c_str(), name.c_str());
    if (reportOutcome(output, "LumoLib_DeactivateProvider failed with error ", code)) {
        output->Complete();
    }
}

} // namespace TarselCli::LumoNamespace
