// SPDX-License-Identifier: Apache-2.0
#include "doubles/KestrelDouble.h"

#include <cstdio>
#include <cstdlib>

#include "kestrel/Storage.h"
#include "kestrel/Util.h"

using Gantry::Storage::LumoFileSystem;
using Gantry::Storage::VendorProviderInfo;

namespace Doubles {
namespace {
KestrelDouble *serving = nullptr;
}

KestrelDouble::KestrelDouble(CallLog &callLog)
    : log(callLog) {
    serving = this;
}

KestrelDouble::~KestrelDouble() {
    serving = nullptr;
}

KestrelDouble &KestrelDouble::current() {
    if (serving == nullptr) {
        std::fputs("a host operation was called while no KestrelDouble lives\n", stderr);
        std::abort();
    }
    return *serving;
}

namespace {

KestrelDouble &host() {
    return KestrelDouble::current();
}

LumoFileSystem *make(std::optional<FileSystemScript> const &script) {
    return script ? new RecordingFileSystem(*script) : nullptr;
}

Verbatim print(std::vector<VendorProviderInfo> const &records) {
    std::string result = "[";
    char const *recordSeparator = "";
    for (VendorProviderInfo const &record : records) {
        result += recordSeparator + quoted(record.name) + " at " + quoted(record.url) + " aux " +
                  quoted(record.auxText) + " arrays {";
        recordSeparator = ", ";
        char const *arraySeparator = "";
        for (Gantry::Storage::RelatedStorageArrayInfo const &array : record.arrays) {
            result += arraySeparator + quoted(array.arrayId) + (array.isActive ? " active " : " passive ") +
                      std::to_string(array.priority);
            arraySeparator = ", ";
        }
        result += "}";
    }
    return {result + "]"};
}

} // namespace
} // namespace Doubles

using namespace Doubles;

namespace Kestrel::Storage {

StorageInfoImpl::StorageInfoImpl()
    : impl_(new char('h')) {
    host().log.call("StorageInfoImpl");
    ++host().liveHosts;
}

StorageInfoImpl::~StorageInfoImpl() {
    host().log.call("~StorageInfoImpl");
    --host().liveHosts;
    delete static_cast<char *>(impl_);
}

std::vector<LumoFileSystem *> StorageInfoImpl::GetLumoFileSystems() {
    host().log.call("StorageInfoImpl.GetLumoFileSystems");
    std::vector<LumoFileSystem *> result;
    for (FileSystemScript const &script : host().getLumoFileSystems.next()) {
        result.push_back(make(script));
    }
    return result;
}

LumoFileSystem *StorageInfoImpl::AddLumoFileSystem(std::string const &name, std::string &id,
                                                   std::vector<std::string> const &arrayIds, bool mount) {
    host().log.call("StorageInfoImpl.AddLumoFileSystem", name, id, arrayIds, mount);
    id = "written by the host"; // the host may bring the id into another spelling
    return make(host().addLumoFileSystem.next());
}

LumoFileSystem *StorageInfoImpl::GetLumoFileSystemByPath(std::string const &path) {
    host().log.call("StorageInfoImpl.GetLumoFileSystemByPath", path);
    return make(host().getLumoFileSystemByPath.next());
}

void StorageInfoImpl::RemoveLumoFileSystem(std::string containerId) {
    host().log.call("StorageInfoImpl.RemoveLumoFileSystem", containerId);
    host().removeLumoFileSystem.next();
}

bool StorageInfoImpl::LumoVpExists(std::string const &name) {
    host().log.call("StorageInfoImpl.LumoVpExists", name);
    return host().lumoVpExists.next();
}

void StorageInfoImpl::GetLumoVendorProviders(std::string const &name, std::vector<VendorProviderInfo> &records) {
    host().log.call("StorageInfoImpl.GetLumoVendorProviders", name, print(records));
    for (VendorProviderInfo const &record : host().getLumoVendorProviders.next()) {
        records.push_back(record);
    }
}

void StorageInfoImpl::UpdateLumoVendorProvider(std::vector<VendorProviderInfo> const &records) {
    host().log.call("StorageInfoImpl.UpdateLumoVendorProvider", print(records));
    host().updateLumoVendorProvider.next();
}

void StorageInfoImpl::NotifyLumoProtocolEndpointEvent(std::string const &pe,
                                                      Gantry::Storage::ProtocolEndPointEvent event,
                                                      std::vector<std::string> &containers) {
    host().log.call("StorageInfoImpl.NotifyLumoProtocolEndpointEvent", pe, static_cast<int>(event), containers);
    containers = host().notifyEndpointEvent.next();
}

void LumoFileSystemImpl::UnRegisterVendorProvider(std::string const &name) {
    host().log.call("LumoFileSystemImpl.UnRegisterVendorProvider", name);
    host().unRegisterVendorProvider.next();
}

void LumoFileSystemImpl::SetOrkaContext(std::string const &uuid) {
    host().log.call("LumoFileSystemImpl.SetOrkaContext", uuid);
    host().setOrkaContext.next();
}

void LumoFileSystemImpl::ClearOrkaContext() {
    host().log.call("LumoFileSystemImpl.ClearOrkaContext");
    host().clearOrkaContext.next();
}

} // namespace Kestrel::Storage

std::string Kestrel::Util::VectorToString(std::vector<std::string> const &elements, std::string const &separator) {
    host().log.call("VectorToString", elements, separator);
    std::string result;
    for (std::size_t i = 0; i < elements.size(); ++i) {
        result += (i == 0 ? "" : separator) + elements[i];
    }
    return result;
}
