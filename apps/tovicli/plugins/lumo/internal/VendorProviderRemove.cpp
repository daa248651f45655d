// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderRemove.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "gantry/Lib.h"
#include "kestrel/Storage.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderRemove> VendorProviderRemove::New() {
    return boost::make_shared<VendorProviderRemove>();
}

VendorProviderRemove::VendorProviderRemove() {
    SetDescription("Unregister a Orka Provider from Tovi host.");
    SetMetaDataField("type", "operation");
    openSession("VendorProviderRemove", 35);
}

VendorProviderRemove::~VendorProviderRemove() {
    closeSession();
}

InputSpecPtr VendorProviderRemove::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "v", true, "Orka Provider Name"},
    });
}

OutputSpecPtr VendorProviderRemove::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void VendorProviderRemove::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const name = input->GetString("vp-name");
    try {
        Kestrel::Storage::LumoFileSystemImpl::UnRegisterVendorProvider(name);
        output->SetResult(MetaObj::MetaBool::New(true));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage(failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
