// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderActivate.h"

#include <array>
#include <cstddef>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "DaemonText.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderActivate> VendorProviderActivate::New() {
    return boost::make_shared<VendorProviderActivate>();
}

VendorProviderActivate::VendorProviderActivate() {
    SetDescription("Activate Orka Provider for a specified Array.");
    SetMetaDataField("type", "operation");
    openSession("VendorProviderActivate", 36);
}

VendorProviderActivate::~VendorProviderActivate() {
    closeSession();
}

InputSpecPtr VendorProviderActivate::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "n", true, "Name of the VP to be activated"},
        {"arrayid", CallSpec::String, "a", true, "ID of the Array to be activated"},
        {"activevpurl", CallSpec::String, "u", false, "URL of current active VP."},
    });
}

OutputSpecPtr VendorProviderActivate::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void VendorProviderActivate::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const arrayId = input->GetString("arrayid");
    std::string const name = input->GetString("vp-name");
    std::string const activeUrl = input->GetString("activevpurl");
    alignas(std::max_align_t) std::array<unsigned char, 64> block = {};
    int32_t const code = LumoLib_ActivateProvider(arrayId.c_str(), name.c_str(), activeUrl.c_str(), block.data());
    if (reportOutcome(output, "LumoLib_ActivateProvider failed with error ", code)) {
        output->Complete();
    }
}

} // namespace TarselCli::LumoNamespace
