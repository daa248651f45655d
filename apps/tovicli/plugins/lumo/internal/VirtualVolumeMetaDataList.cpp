// SPDX-License-Identifier: Apache-2.0
#include "VirtualVolumeMetaDataList.h"

#include <memory>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "VirtualVolume.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

namespace {

constexpr char const *structureName = "LumoMetaData";

} // namespace

boost::shared_ptr<VirtualVolumeMetaDataList> VirtualVolumeMetaDataList::New() {
    return boost::make_shared<VirtualVolumeMetaDataList>();
}

VirtualVolumeMetaDataList::VirtualVolumeMetaDataList() {
    SetDescription("List Virtual Volume MetaData.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("table");
}

InputSpecPtr VirtualVolumeMetaDataList::GetInputSpecInternal() {
    return declareVirtualVolumeParameters();
}

OutputSpecPtr VirtualVolumeMetaDataList::GetOutputSpecInternal() {
    return declareResult(makeStructList(GetOutputStructure()));
}

StructPtr VirtualVolumeMetaDataList::GetOutputStructure() {
    StructPtr const pair = MetaObj::MetaStruct::New(structureName);
    pair->SetField("key", MetaObj::MetaString::New());
    pair->SetField("value", MetaObj::MetaString::New());
    return pair;
}

void VirtualVolumeMetaDataList::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    openSession("VirtualVolumeMetaDataList", 88); // stays with the process
    std::optional<VirtualVolume> const volume = readVirtualVolume(input, output);
    if (!volume) {
        return;
    }
    LumoMetadata *metadata = nullptr;
    if (LumoLib_GetLumoMetadata(volume->containerId.c_str(), volume->uuid.c_str(), &metadata) != 0) {
        output->SetMessage("Failed to get the metadata for Lumo.");
        return;
    }
    std::unique_ptr<LumoMetadata, void (*)(LumoMetadata *)> const owner(metadata, LumoLib_FreeLumoMetadata);
    ListPtr const list = makeStructList(GetOutputStructure());
    for (LumoMetadataEntry const *entry = metadata->first; entry != nullptr; entry = entry->next) {
        // Not from the schema: its empty texts would be made for each pair, only to be replaced.
        StructPtr const pair = MetaObj::MetaStruct::New(structureName);
        pair->SetField("key", entry->key);
        pair->SetField("value", entry->value);
        list->Append(pair);
    }
    output->SetResult(list);
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
