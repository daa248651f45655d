// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumoRemove.h"

#include <boost/make_shared.hpp>

#include "ConfigLumo.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<ConfigLumoRemove> ConfigLumoRemove::New() {
    return boost::make_shared<ConfigLumoRemove>();
}

ConfigLumoRemove::ConfigLumoRemove() {
    SetDescription("Unmount and delete a given config Lumo.");
    SetMetaDataField("type", "operation");
}

InputSpecPtr ConfigLumoRemove::GetInputSpecInternal() {
    return declareVolumeParameters("Directory Path");
}

OutputSpecPtr ConfigLumoRemove::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void ConfigLumoRemove::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    runOnVolume(input, output, "Either name or uuid is required", &Gantry::Storage::FileSystem::RemoveConfigLumo);
}

} // namespace TarselCli::LumoNamespace
