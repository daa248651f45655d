// SPDX-License-Identifier: Apache-2.0
#include "VirtualVolumeGet.h"

#include <cstdlib>
#include <memory>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "VirtualVolume.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<VirtualVolumeGet> VirtualVolumeGet::New() {
    return boost::make_shared<VirtualVolumeGet>();
}

VirtualVolumeGet::VirtualVolumeGet() {
    SetDescription("Get information about a Virtual Volume.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("units:LumoInfoInternal.Logical Size", "MB");
    SetDefaultOutputParameter("units:LumoInfoInternal.Committed Size", "MB");
    SetDefaultOutputParameter("units:LumoInfoInternal.Unshared Size", "MB");
    SetDefaultOutputParameter("fields:LumoInfoInternal", "Container Id,Lumo UUID,Logical Size,Committed Size,Unshared "
                                                         "Size Valid,Unshared Size,Storage Profile,Block Size");
}

InputSpecPtr VirtualVolumeGet::GetInputSpecInternal() {
    return declareVirtualVolumeParameters();
}

OutputSpecPtr VirtualVolumeGet::GetOutputSpecInternal() {
    return declareResult(GetOutputStructure());
}

StructPtr VirtualVolumeGet::GetOutputStructure() {
    StructPtr const volume = MetaObj::MetaStruct::New("LumoInfoInternal");
    volume->SetField("Container Id", MetaObj::MetaString::New());
    volume->SetField("Lumo UUID", MetaObj::MetaString::New());
    volume->SetField("Logical Size", MetaObj::MetaInt::New());
    volume->SetField("Committed Size", MetaObj::MetaInt::New());
    volume->SetField("Unshared Size Valid", MetaObj::MetaBool::New());
    volume->SetField("Unshared Size", MetaObj::MetaInt::New());
    volume->SetField("Storage Profile", MetaObj::MetaString::New());
    volume->SetField("Block Size", MetaObj::MetaInt::New());
    return volume;
}

namespace {

/// Each of these asks the daemon and sets what it answers; false when it refuses.
bool setSizes(StructPtr const &description, VirtualVolume const &volume) {
    LumoSpaceStats *stats = nullptr;
    if (LumoLib_SpaceStatsForLumo(volume.containerId.c_str(), volume.uuid.c_str(), &stats) != 0) {
        return false;
    }
    std::unique_ptr<LumoSpaceStats, void (*)(LumoSpaceStats *)> const owner(stats, LumoLib_FreeLumoSpaceStatsInfo);
    description->SetField("Logical Size", stats->logicalSize);
    description->SetField("Committed Size", stats->committedSize);
    bool const isValid = stats->unsharedSizeValid != 0;
    if (isValid) {
        description->SetField("Unshared Size", stats->unsharedSize);
    }
    description->SetField("Unshared Size Valid", MetaObj::MetaBool::New(isValid));
    return true;
}

bool setStorageProfile(StructPtr const &description, VirtualVolume const &volume) {
    LumoInfo *info = nullptr;
    if (LumoLib_GetLumoInfo(volume.containerId.c_str(), volume.uuid.c_str(), &info) != 0) {
        return false;
    }
    std::unique_ptr<LumoInfo, void (*)(LumoInfo *)> const owner(info, LumoLib_FreeLumoInfo);
    if (info->storageProfile != nullptr) {
        description->SetField("Storage Profile", info->storageProfile);
    }
    return true;
}

bool setBlockSize(StructPtr const &description, VirtualVolume const &volume) {
    LumoUnsharedChunks *chunks = nullptr;
    if (LumoLib_UnsharedChunksLumo(volume.containerId.c_str(), volume.uuid.c_str(), 0, 0, 0, 0, 0, &chunks) != 0) {
        return false;
    }
    std::unique_ptr<LumoUnsharedChunks, void (*)(void *)> const owner(chunks, std::free);
    description->SetField("Block Size", chunks->blockSize);
    return true;
}

} // namespace

void VirtualVolumeGet::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    openSession("VirtualVolumeGet", 102); // stays with the process
    std::optional<VirtualVolume> const volume = readVirtualVolume(input, output);
    if (!volume) {
        return;
    }
    StructPtr const description = GetOutputStructure();
    description->SetField("Lumo UUID", volume->uuid);
    description->SetField("Container Id", volume->containerId);
    if (!setSizes(description, *volume)) {
        output->SetMessage("Failed to get space stats for Lumo.");
        return;
    }
    if (!setStorageProfile(description, *volume)) {
        output->SetMessage("Failed to get the storage profile for Lumo.");
        return;
    }
    if (!setBlockSize(description, *volume)) {
        output->SetMessage("Failed to get block size for Lumo.");
        return;
    }
    output->SetResult(description);
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
