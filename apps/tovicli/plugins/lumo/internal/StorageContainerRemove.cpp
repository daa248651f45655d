// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerRemove.h"

#include <array>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "gantry/Lib.h"
#include "kestrel/Storage.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<StorageContainerRemove> StorageContainerRemove::New() {
    return boost::make_shared<StorageContainerRemove>();
}

StorageContainerRemove::StorageContainerRemove() {
    SetDescription("Remove given Lumo StorageContainer from Tovi host");
    SetMetaDataField("type", "operation");
    openSession("StorageContainerRemove", 31);
}

StorageContainerRemove::~StorageContainerRemove() {
    closeSession();
}

InputSpecPtr StorageContainerRemove::GetInputSpecInternal() {
    return declareParameters({
        {"container-id", CallSpec::String, "c", true, "StorageContainer ID"},
    });
}

OutputSpecPtr StorageContainerRemove::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void StorageContainerRemove::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const id = input->GetString("container-id");
    std::array<char, 37> canonical = {};
    if (!LumoLib_NormalizeContainerIdString(id.c_str(), canonical.data())) {
        output->SetMessage("Bad CID : " + id);
        return;
    }
    try {
        host.RemoveLumoFileSystem(canonical.data());
        output->SetResult(MetaObj::MetaBool::New(true));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage(failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
