// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderAdd.h"

#include <boost/make_shared.hpp>

#include "ProviderArrays.h"
#include "gantry/Lib.h"
#include "kestrel/Storage.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderAdd> VendorProviderAdd::New() {
    return boost::make_shared<VendorProviderAdd>();
}

VendorProviderAdd::VendorProviderAdd() {
    SetDescription("Add a new Orka Provider on the host.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr VendorProviderAdd::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "v", true, "Orka Provider Name"},
        {"vp-url", CallSpec::String, "U", true, "VP URL"},
        {"arrayid", CallSpec::StringList, "a", false, "Array Id"},
        {"priority", CallSpec::IntList, "p", false, "Priority"},
        {"isactive", CallSpec::BoolList, "i", false, "Is Active"},
    });
}

OutputSpecPtr VendorProviderAdd::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

void VendorProviderAdd::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const url = input->GetString("vp-url");
    std::string const name = input->GetString("vp-name");
    Kestrel::Storage::StorageInfoImpl host;
    if (name.empty()) {
        output->SetMessage("Empty VP Name not allowed.");
        return;
    }
    if (host.LumoVpExists(name)) {
        output->SetMessage("Cannot Add VP as : " + name + " already exists\n");
        return;
    }
    auto const arrays = readProviderArrays(input, output);
    if (!arrays) {
        return;
    }
    try {
        std::vector<Gantry::Storage::VendorProviderInfo> records = {makeProvider(name, url, *arrays)};
        host.UpdateLumoVendorProvider(records);
        if (arrays->empty()) {
            // The host may have filled in arrays of its own; confirm exactly what it now holds.
            records.clear();
            host.GetLumoVendorProviders(name, records);
            host.UpdateLumoVendorProvider(records);
        }
        output->SetResult(MetaObj::MetaString::New("Succesfully Added VP with name : " + name + "\n"));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage("Failed to add VP: " + failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
