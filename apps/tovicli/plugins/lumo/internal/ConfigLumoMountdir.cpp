// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumoMountdir.h"

#include <boost/make_shared.hpp>

#include "ConfigLumo.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<ConfigLumoMountdir> ConfigLumoMountdir::New() {
    return boost::make_shared<ConfigLumoMountdir>();
}

ConfigLumoMountdir::ConfigLumoMountdir() {
    SetDescription("Mount a given config Lumo as directory in the Tovi file system");
    SetMetaDataField("type", "operation");
}

InputSpecPtr ConfigLumoMountdir::GetInputSpecInternal() {
    return declareVolumeParameters("Directory Name");
}

OutputSpecPtr ConfigLumoMountdir::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void ConfigLumoMountdir::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    runOnVolume(input, output, "Either name or uuid is required", &Gantry::Storage::FileSystem::MountConfigLumo);
}

} // namespace TarselCli::LumoNamespace
