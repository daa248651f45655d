// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerAdd.h"

#include <memory>

#include <boost/make_shared.hpp>

#include "gantry/Lib.h"
#include "gantry/Storage.h"
#include "kestrel/Storage.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<StorageContainerAdd> StorageContainerAdd::New() {
    return boost::make_shared<StorageContainerAdd>();
}

StorageContainerAdd::StorageContainerAdd() {
    SetDescription("Add a new Lumo StorageContainer to the Tovi Host and mount it with the given volume name.");
    SetMetaDataField("type", "operation");
}

InputSpecPtr StorageContainerAdd::GetInputSpecInternal() {
    return declareParameters({
        {"container-name", CallSpec::String, "n", true, "StorageContainer Name"},
        {"container-id", CallSpec::String, "c", true, "StorageContainer ID"},
        {"array", CallSpec::StringList, "a", false, "List of Array UUID"},
    });
}

OutputSpecPtr StorageContainerAdd::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void StorageContainerAdd::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const name = input->GetString("container-name");
    std::string id = input->GetString("container-id");
    std::vector<std::string> const arrays = input->GetStringList("array");
    try {
        std::unique_ptr<Gantry::Storage::LumoFileSystem> fileSystem(host.AddLumoFileSystem(name, id, arrays, true));
        output->SetResult(MetaObj::MetaBool::New(fileSystem != nullptr));
        fileSystem.reset();
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage(failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
