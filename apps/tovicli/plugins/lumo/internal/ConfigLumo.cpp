// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumo.h"

#include "gantry/Lib.h"

using namespace Plexa;
using Gantry::Storage::LumoFileSystem;

namespace TarselCli::LumoNamespace {

FileSystems mountedFileSystems(Kestrel::Storage::StorageInfoImpl &host) {
    std::vector<LumoFileSystem *> const handedOut = host.GetLumoFileSystems();
    FileSystems fileSystems(handedOut.size());
    for (std::size_t i = 0; i < handedOut.size(); ++i) {
        fileSystems[i].reset(handedOut[i]);
    }
    return fileSystems;
}

LumoFileSystem *findContainer(FileSystems const &fileSystems, std::string const &containerId) {
    for (auto const &fileSystem : fileSystems) {
        if (fileSystem->HasContainerId(containerId)) {
            return fileSystem.get();
        }
    }
    return nullptr;
}

void reportUnknownContainer(OutputPtr const &output, std::string const &containerId) {
    output->SetMessage("Failed to find Lumo StorageContainer " + containerId);
    output->SetResult(MetaObj::MetaBool::New(false));
}

InputSpecPtr declareVolumeParameters(char const *nameDescription) {
    return declareParameters({
        {"name", CallSpec::String, "n", false, nameDescription},
        {"container-id", CallSpec::String, "c", true, "StorageContainer ID"},
        {"uuid", CallSpec::String, "u", false, "meta-lumo UUID"},
        {"priority", CallSpec::Flag, nullptr, false,
         "Use priority socket to allow out-of-order execution of this request"},
    });
}

void runOnVolume(InputPtr const &input, OutputPtr const &output, char const *missingText, VolumeOperation operation) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const containerId = input->GetString("container-id");
    bool const priority = input->HasParameter("priority");
    std::string name;
    std::string uuid;
    if (input->HasParameter("uuid")) {
        uuid = input->GetString("uuid");
    } else if (input->HasParameter("name")) {
        name = input->GetString("name");
    } else {
        output->SetMessage(missingText);
        output->SetResult(MetaObj::MetaBool::New(false));
        return;
    }

    FileSystems const fileSystems = mountedFileSystems(host);
    try {
        LumoFileSystem *const fileSystem = findContainer(fileSystems, containerId);
        if (fileSystem == nullptr) {
            reportUnknownContainer(output, containerId);
            return;
        }
        (fileSystem->*operation)(name, uuid, "", priority);
        output->SetResult(MetaObj::MetaBool::New(true));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage(failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
