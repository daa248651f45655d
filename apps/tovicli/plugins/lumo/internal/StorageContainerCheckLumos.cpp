// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerCheckLumos.h"

#include <memory>

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "DaemonText.h"
#include "gantry/Lib.h"
#include "gantry/Storage.h"
#include "kestrel/Storage.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<StorageContainerCheckLumos> StorageContainerCheckLumos::New() {
    return boost::make_shared<StorageContainerCheckLumos>();
}

StorageContainerCheckLumos::StorageContainerCheckLumos() {
    SetDescription("Check availability of given Lumos in a StorageContainer");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:LumosAreAccessible", "LumoId,Status");
    openSession("StorageContainerCheckLumos", 40);
}

StorageContainerCheckLumos::~StorageContainerCheckLumos() {
    closeSession();
}

InputSpecPtr StorageContainerCheckLumos::GetInputSpecInternal() {
    return declareParameters({
        {"path", CallSpec::String, "p", true, "Lumo datastore path"},
        {"lumo", CallSpec::StringList, "v", false, "Lumo Uuid"},
    });
}

OutputSpecPtr StorageContainerCheckLumos::GetOutputSpecInternal() {
    return declareResult(makeStructList(GetOutputStructure()));
}

StructPtr StorageContainerCheckLumos::GetOutputStructure() {
    StructPtr const lumo = MetaObj::MetaStruct::New("LumosAreAccessible");
    lumo->SetField("LumoId", MetaObj::MetaString::New());
    lumo->SetField("Status", MetaObj::MetaString::New());
    return lumo;
}

namespace {

/// The ids of all config volumes in a container; none when the daemon cannot be asked.
std::vector<std::string> configLumoIds(std::string const &containerId) {
    struct Query {
        LumoQueryResult *result = nullptr;
        ~Query() {
            LumoLib_FreeQueryResult(result);
        }
    } query;
    std::vector<std::string> ids;
    if (LumoLib_QueryAllConfigLumos(containerId.c_str(), INT32_MAX, 0, &query.result, 0) == 0 &&
        query.result->count > 0) {
        LumoQueryEntry *const *const entries = query.result->entries;
        ids.reserve(static_cast<std::size_t>(query.result->count));
        for (int32_t i = 0; i < query.result->count; ++i) {
            ids.push_back(textOrEmpty(entries[i]->id));
        }
    }
    return ids;
}

/// Null for a value that has no text.
char const *statusText(Gantry::Storage::LumoAccessibilityType accessibility) {
    switch (accessibility) {
    case Gantry::Storage::NonExistent:
        return "non-existent";
    case Gantry::Storage::Unconfirmed:
        return "unconfirmed";
    case Gantry::Storage::Inaccessible:
        return "inaccessible";
    case Gantry::Storage::Accessible:
        return "accessible";
    default:
        return nullptr;
    }
}

} // namespace

void StorageContainerCheckLumos::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const path = input->GetString("path");
    std::vector<std::string> ids = input->GetStringList("lumo");
    std::unique_ptr<Gantry::Storage::LumoFileSystem> fileSystem;
    try {
        ListPtr const list = makeStructList(GetOutputStructure());
        fileSystem.reset(host.GetLumoFileSystemByPath(path));
        if (fileSystem == nullptr) {
            output->SetMessage("Bad datastore path");
            return;
        }
        if (ids.empty()) {
            ids = configLumoIds(fileSystem->GetContainerId());
        }
        auto const accessibility = fileSystem->CheckLumoAccessibility(ids);
        for (std::size_t i = 0; i < accessibility.size() && i < ids.size(); ++i) {
            StructPtr const lumo = GetOutputStructure();
            lumo->SetField("LumoId", ids[i]);
            if (char const *const status = statusText(accessibility[i])) {
                lumo->SetField("Status", status);
            }
            list->Append(lumo);
        }
        output->SetResult(list);
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        // Stays with the process: a file system that has just failed is not asked to tidy up after itself.
        static_cast<void>(fileSystem.release());
        output->SetMessage(failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
