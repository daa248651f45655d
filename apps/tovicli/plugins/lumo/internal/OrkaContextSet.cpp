// SPDX-License-Identifier: Apache-2.0
#include "OrkaContextSet.h"

#include <boost/make_shared.hpp>

#include "gantry/Lib.h"
#include "kestrel/Storage.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<OrkaContextSet> OrkaContextSet::New() {
    return boost::make_shared<OrkaContextSet>();
}

OrkaContextSet::OrkaContextSet() {
    SetDescription("Set the Lumo Orka context (Nexa UUID) on the host.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

InputSpecPtr OrkaContextSet::GetInputSpecInternal() {
    return declareParameters({
        {"uuid", CallSpec::String, "u", false,
         "The Nexa UUID for the Lumo Orka context you wish to configure on the host"},
        {"clear", CallSpec::Flag, "c", false, "Clear the Lumo Orka context for the host"},
    });
}

OutputSpecPtr OrkaContextSet::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

namespace {

using Gantry::Lib::GantryException;
using Kestrel::Storage::LumoFileSystemImpl;

/// @throws GantryException for bad arguments, like the host for what it refuses.
void changeContext(InputPtr const &input) {
    bool const clear = input->GetBool("clear");
    if (clear == input->HasParameter("uuid")) {
        throw GantryException("Exactly one of --clear or --uuid must be specified!", Gantry::Lib::QuibMessage());
    }
    if (clear) {
        LumoFileSystemImpl::ClearOrkaContext();
        return;
    }
    std::string const uuid = input->GetString("uuid");
    if (uuid.empty()) {
        throw GantryException("--uuid requires a parameter", Gantry::Lib::QuibMessage());
    }
    LumoFileSystemImpl::SetOrkaContext(uuid);
}

} // namespace

void OrkaContextSet::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    try {
        changeContext(input);
        output->SetResult(MetaObj::MetaBool::New(true));
    } catch (GantryException const &failure) {
        output->SetMessage("Failed to update host Orka context Uuid: " + failure.GetMessage());
        output->SetResult(MetaObj::MetaBool::New(false));
    }
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
