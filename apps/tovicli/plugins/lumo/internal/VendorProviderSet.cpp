// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderSet.h"

#include <boost/make_shared.hpp>

#include "ProviderArrays.h"
#include "gantry/Lib.h"
#include "kestrel/Storage.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderSet> VendorProviderSet::New() {
    return boost::make_shared<VendorProviderSet>();
}

VendorProviderSet::VendorProviderSet() {
    SetDescription("Update an existing Orka Provider on the host.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr VendorProviderSet::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "v", true, "Orka Provider Name"},
        {"arrayid", CallSpec::StringList, "a", false, "Array Id"},
        {"priority", CallSpec::IntList, "p", false, "Priority(integer). Should be specified with arrayId"},
        {"isactive", CallSpec::BoolList, "i", false, "IsActive(Boolean value). Should be specified with arrayId"},
    });
}

OutputSpecPtr VendorProviderSet::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

void VendorProviderSet::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const name = input->GetString("vp-name");
    if (!host.LumoVpExists(name)) {
        output->SetMessage("Cannot Update VP as : " + name + " does not exist\n");
        return;
    }
    auto const arrays = readProviderArrays(input, output);
    if (!arrays) {
        return;
    }
    try {
        std::vector<Gantry::Storage::VendorProviderInfo> existing;
        host.GetLumoVendorProviders(name, existing);
        if (existing.empty()) {
            output->SetMessage("Failed to update VP: the host has no record of " + name);
            return;
        }
        host.UpdateLumoVendorProvider({makeProvider(name, existing.front().url, *arrays)});
        output->SetResult(MetaObj::MetaString::New("Successfully Updated VP with name : " + name + "\n"));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage("Failed to update VP" + failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
