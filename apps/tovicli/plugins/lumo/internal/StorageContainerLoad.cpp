// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerLoad.h"

#include <string_view>
#include <unordered_map>
#include <utility>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "DaemonText.h"
#include "EndpointLine.h"
#include "gantry/Lib.h"
#include "gantry/Storage.h"
#include "kestrel/Storage.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;
using Gantry::Storage::LumoFileSystem;
using Kestrel::Storage::StorageInfoImpl;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<StorageContainerLoad> StorageContainerLoad::New() {
    return boost::make_shared<StorageContainerLoad>();
}

StorageContainerLoad::StorageContainerLoad() {
    SetDescription("Load All the Lumo StorageContainers exported by the VP.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("header:StorageContainer", "%StorageContainer Name%");
    SetDefaultOutputParameter("header:Array", "%ArrayId%");
    SetDefaultOutputParameter("table-columns",
                              "StorageContainer Name,StorageContainer Id,Max Lumo Size (MB),VP URL,Arrays");
    openSession("StorageContainerLoad", 42);
}

StorageContainerLoad::~StorageContainerLoad() {
    closeSession();
}

InputSpecPtr StorageContainerLoad::GetInputSpecInternal() {
    return declareParameters({});
}

OutputSpecPtr StorageContainerLoad::GetOutputSpecInternal() {
    return declareResult(makeStructList(GetOutputStructure()));
}

StructPtr StorageContainerLoad::GetOutputStructure() {
    StructPtr const container = MetaObj::MetaStruct::New("StorageContainer");
    container->SetField("StorageContainer Name", MetaObj::MetaString::New());
    container->SetField("StorageContainer Id", MetaObj::MetaString::New());
    container->SetField("Max Lumo Size (MB)", MetaObj::MetaInt::New());
    container->SetField("VP URL", MetaObj::MetaString::New());
    container->SetField("Arrays", makeStructList(GetStorageArrayStructure()));
    return container;
}

StructPtr StorageContainerLoad::GetStorageArrayStructure() {
    StructPtr const array = MetaObj::MetaStruct::New("Array");
    array->SetField("ArrayId", MetaObj::MetaString::New());
    array->SetField("Name", MetaObj::MetaString::New());
    array->SetField("VendorId", MetaObj::MetaString::New());
    array->SetField("ModelId", MetaObj::MetaString::New());
    array->SetField("PEInfo", MetaObj::MetaList::New(MetaObj::StringList));
    return array;
}

ListPtr StorageContainerLoad::GetStorageArrayList(std::vector<SAInfo> &arrays) {
    ListPtr const list = makeStructList(GetStorageArrayStructure());
    for (SAInfo const &info : arrays) {
        StructPtr const array = GetStorageArrayStructure();
        array->SetField("ArrayId", info.ArrayId);
        array->SetField("Name", info.Name);
        array->SetField("VendorId", info.VendorId);
        array->SetField("ModelId", info.ModelId);
        array->SetField("PEInfo", info.PEInfo);
        list->Append(array);
    }
    return list;
}

namespace {

/// The names of what is mounted, of which a host may have a hundred thousand. The daemon mostly tells containers in the
/// order in which they were mounted, so that each is the one behind the last; only when one is not are the names
/// hashed.
class Names {
public:
    explicit Names(std::vector<LumoFileSystem *> const &mounted) {
        names_.reserve(mounted.size());
        for (LumoFileSystem *const fileSystem : mounted) {
            names_.push_back(fileSystem->GetName());
        }
    }

    bool has(std::string_view name) {
        if (next_ < names_.size() && names_[next_] == name) {
            ++next_;
            return true;
        }
        if (places_.empty()) {
            places_.reserve(names_.size());
            for (size_t place = 0; place < names_.size(); ++place) {
                places_.emplace(names_[place], place);
            }
        }
        auto const found = places_.find(name);
        if (found == places_.end()) {
            return false;
        }
        next_ = found->second + 1;
        return true;
    }

private:
    std::vector<std::string> names_;
    size_t next_ = 0;
    std::unordered_map<std::string_view, size_t> places_;
};

/// Mounts a container. The caller deletes the file system of the last mount only: those of earlier mounts stay with the
/// process, which ends with the command.
LumoFileSystem *mountContainer(StorageInfoImpl &host, StorageContainerInfo const &container) {
    std::string id = textOrEmpty(container.id);
    std::vector<std::string> arrayIds;
    for (int32_t i = 0; i < container.arrayCount; ++i) {
        arrayIds.push_back(textOrEmpty(container.arrays[i]->arrayId));
    }
    return host.AddLumoFileSystem(textOrEmpty(container.name), id, arrayIds, true);
}

SAInfo readArray(StorageArrayInfo const &array) {
    SAInfo info;
    info.ArrayId = textOrEmpty(array.arrayId);
    info.Name = textOrEmpty(array.name);
    info.VendorId = textOrEmpty(array.vendorId);
    info.ModelId = textOrEmpty(array.modelId);
    for (int32_t i = 0; i < array.endpointCount; ++i) {
        info.PEInfo.push_back(endpointLine(i, *array.endpoints[i]));
    }
    return info;
}

/// What is printed of a container that was mounted: name and id as the host has them, the rest as the daemon told it.
StructPtr describe(StorageContainerLoad &command, LumoFileSystem &fileSystem, StorageContainerInfo const &container) {
    StructPtr const description = command.GetOutputStructure();
    description->SetField("StorageContainer Name", fileSystem.GetName());
    description->SetField("StorageContainer Id", fileSystem.GetId());
    description->SetField("Max Lumo Size (MB)", container.maxLumoSizeMb);
    description->SetField("VP URL", textOrEmpty(container.providerUrl));
    std::vector<SAInfo> arrays;
    for (int32_t i = 0; i < container.arrayCount; ++i) {
        arrays.push_back(readArray(*container.arrays[i]));
    }
    description->SetField("Arrays", command.GetStorageArrayList(arrays));
    return description;
}

} // namespace

void StorageContainerLoad::ExecuteInternal(InputPtr const & /*input*/, OutputPtr const &output) {
    StorageInfoImpl host;
    StorageContainerResult *containers = nullptr;
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &containers);
    if (!LumoLib_ErrorExIsSuccess(&error)) {
        output->SetMessage("Unable to load Lumo datastores: " + textOrEmpty(LumoLib_ErrorExStr(&error)));
        return;
    }

    // Plain pointers, because what is released depends on how the call ends: an exception that passes on leaves the
    // daemon's answer and every file system with the process, for whoever handles it.
    std::vector<LumoFileSystem *> mounted;
    LumoFileSystem *lastAdded = nullptr;
    try {
        mounted = host.GetLumoFileSystems();
        Names mountedNames(mounted);
        ListPtr const list = makeStructList(GetOutputStructure());
        for (uint32_t i = 0; i < containers->containerCount; ++i) {
            StorageContainerInfo const &container = *containers->containers[i];
            if (mountedNames.has(container.name == nullptr ? "" : container.name)) {
                continue;
            }
            lastAdded = mountContainer(host, container);
            if (lastAdded != nullptr) {
                list->Append(describe(*this, *lastAdded, container));
            }
        }
        output->SetResult(list);
        output->Complete();
        delete lastAdded;
    } catch (Gantry::Lib::GantryException const &failure) {
        // What was mounted last stays with the process here, like what was mounted before it.
        output->SetMessage("Error getting/adding lumo file system '" + failure.GetMessage() + ", skipping");
    }
    for (LumoFileSystem *const fileSystem : mounted) {
        delete fileSystem;
    }
    LumoLib_FreeStorageContainerResult(containers);
}

} // namespace TarselCli::LumoNamespace
