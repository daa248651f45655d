// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumoUmountdir.h"

#include <boost/make_shared.hpp>

#include "ConfigLumo.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<ConfigLumoUmountdir> ConfigLumoUmountdir::New() {
    return boost::make_shared<ConfigLumoUmountdir>();
}

ConfigLumoUmountdir::ConfigLumoUmountdir() {
    SetDescription("Unmount a given Config Lumo from the Tovi file system");
    SetMetaDataField("type", "operation");
}

InputSpecPtr ConfigLumoUmountdir::GetInputSpecInternal() {
    return declareVolumeParameters("Directory Name");
}

OutputSpecPtr ConfigLumoUmountdir::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void ConfigLumoUmountdir::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    runOnVolume(input, output, "Either StorageContainer Name or UUID is required",
                &Gantry::Storage::FileSystem::UnmountConfigLumo);
}

} // namespace TarselCli::LumoNamespace
