// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderInjectFault.h"

#include <cstdlib>
#include <new>

#include <boost/make_shared.hpp>

#include "DaemonText.h"
#include "gantry/Lib.h"
#include "kestrel/Storage.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VendorProviderInjectFault> VendorProviderInjectFault::New() {
    return boost::make_shared<VendorProviderInjectFault>();
}

VendorProviderInjectFault::VendorProviderInjectFault() {
    SetDescription("Inject Orka Provider related fault in Lumod for debugging.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr VendorProviderInjectFault::GetInputSpecInternal() {
    return declareParameters({
        {"vp-name", CallSpec::String, "v", true, "Orka Provider Name"},
        {"status", CallSpec::String, "s", false, "Connection Status of VP (online/offline/syncError/unknown)"},
        {"arrayid", CallSpec::StringList, "a", false, "Array Id"},
        {"isactive", CallSpec::BoolList, "i", false,
         "IsActive(Boolean value). Should be specified along with parameter arrayId"},
    });
}

OutputSpecPtr VendorProviderInjectFault::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

namespace {

/// One entry for each array; an entry points to the array's id among those given. What is allocated here stays with the
/// process, which ends with the command.
LumoArrayFault *makeEntries(std::vector<std::string> const &arrayIds, std::vector<bool> const &activeFlags) {
    auto *const entries = static_cast<LumoArrayFault *>(std::malloc(arrayIds.size() * sizeof(LumoArrayFault)));
    if (entries == nullptr) {
        if (arrayIds.empty()) {
            return nullptr;
        }
        throw std::bad_alloc();
    }
    for (std::size_t i = 0; i < arrayIds.size(); ++i) {
        entries[i] = {arrayIds[i].c_str(), static_cast<uint8_t>(activeFlags[i] ? 1 : 0), nullptr};
    }
    return entries;
}

} // namespace

void VendorProviderInjectFault::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string status = input->GetString("status");
    std::string const name = input->GetString("vp-name");
    if (status.empty()) {
        status = "default";
    }
    if (!host.LumoVpExists(name)) {
        output->SetMessage("VP : " + name + " does not exist\n");
        return;
    }
    std::vector<std::string> const arrayIds = input->GetStringList("arrayid");
    std::vector<bool> const activeFlags = input->GetBoolList("isactive");
    if (arrayIds.size() != activeFlags.size()) {
        output->SetMessage("Missing one of the parameter arrayId or isActive");
        return;
    }
    LumoArrayFault *const entries = makeEntries(arrayIds, activeFlags);
    std::vector<Gantry::Storage::VendorProviderInfo> records;
    try {
        host.GetLumoVendorProviders(name, records);
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage("InjectFault failed for VP" + failure.GetMessage());
        return;
    }
    if (records.empty()) {
        // NOLINTNEXTLINE(clang-analyzer-unix.Malloc): the entries stay, see makeEntries
        output->SetMessage("InjectFault failed for VP: the host has no record of " + name);
        return;
    }
    int32_t const code = LumoLib_VendorProviderInjectFault(name.c_str(), records.front().url.c_str(), status.c_str(),
                                                           static_cast<int32_t>(arrayIds.size()), entries);
    if (code != 0) {
        output->SetMessage("VendorProviderInjectFault failed for VP with name : " + name +
                           " with error: " + textOrEmpty(LumoLib_Err2String(code)));
        return;
    }
    output->SetResult(MetaObj::MetaString::New("Successfully Injected fault for VP with name : " + name + "\n"));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
