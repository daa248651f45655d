// SPDX-License-Identifier: Apache-2.0
//
// The plug-in's entry point and the tree that it hangs below "storage": what a user types, in the order of help. A
// namespace is attached to its parent when all its children are in it, and "lumo" last of all, so that a constructor
// that throws leaves no half-filled subtree in sight.
#include <boost/pointer_cast.hpp>

#include "ConfigLumoAdd.h"
#include "ConfigLumoMountdir.h"
#include "ConfigLumoRemove.h"
#include "ConfigLumoUmountdir.h"
#include "DaemonCommand.h"
#include "FaultInjectionEnable.h"
#include "FaultInjectionRuleAdd.h"
#include "FaultInjectionRuleRemove.h"
#include "FaultInjectionRuleSet.h"
#include "OrkaContextSet.h"
#include "StorageContainerAdd.h"
#include "StorageContainerCheckLumos.h"
#include "StorageContainerLoad.h"
#include "StorageContainerRemove.h"
#include "VendorProviderActivate.h"
#include "VendorProviderAdd.h"
#include "VendorProviderDeactivate.h"
#include "VendorProviderInjectFault.h"
#include "VendorProviderRemove.h"
#include "VendorProviderSet.h"
#include "VirtualVolumeGet.h"
#include "VirtualVolumeMetaDataList.h"
#include "gantry/Lib.h"
#include "plexa/AutoCli.h"

using Plexa::AutoCli::Namespace;
using NamespacePtr = boost::shared_ptr<Namespace>;

namespace TarselCli::LumoNamespace {
namespace {

NamespacePtr makeNamespace(std::string const &description) {
    NamespacePtr const node = Namespace::New();
    node->SetDescription(description);
    return node;
}

void registerOrkaProvider(NamespacePtr const &lumo) {
    NamespacePtr const orkaProvider = makeNamespace("Manage Lumo Orka Provider Operations.");
    orkaProvider->RegisterNamespaceNode(VendorProviderAdd::New(), "add");
    orkaProvider->RegisterNamespaceNode(VendorProviderSet::New(), "set");
    orkaProvider->RegisterNamespaceNode(VendorProviderRemove::New(), "remove");
    orkaProvider->RegisterNamespaceNode(VendorProviderActivate::New(), "activate");
    orkaProvider->RegisterNamespaceNode(VendorProviderDeactivate::New(), "deactivate");
    orkaProvider->RegisterNamespaceNode(VendorProviderInjectFault::New(), "injectfault");
    lumo->RegisterNamespaceNode(orkaProvider, "orkaprovider");
}

void registerFaultInjection(NamespacePtr const &lumo) {
    NamespacePtr const faultInjection = makeNamespace("Manage fault injection.");
    faultInjection->RegisterNamespaceNode(FaultInjectionEnable::New(), "enable");
    NamespacePtr const rule = Namespace::New();
    rule->RegisterNamespaceNode(FaultInjectionRuleAdd::New(), "add");
    rule->RegisterNamespaceNode(FaultInjectionRuleSet::New(), "set");
    rule->RegisterNamespaceNode(FaultInjectionRuleRemove::New(), "remove");
    faultInjection->RegisterNamespaceNode(rule, "rule");
    lumo->RegisterNamespaceNode(faultInjection, "faultInjection");
}

void registerStorageContainer(NamespacePtr const &lumo) {
    NamespacePtr const storageContainer =
        makeNamespace("Operations to create, manage, remove and restore Lumo StorageContainers.");
    storageContainer->RegisterNamespaceNode(StorageContainerLoad::New(), "load");
    storageContainer->RegisterNamespaceNode(StorageContainerAdd::New(), "add");
    storageContainer->RegisterNamespaceNode(StorageContainerRemove::New(), "remove");
    storageContainer->RegisterNamespaceNode(StorageContainerCheckLumos::New(), "checklumos");
    lumo->RegisterNamespaceNode(storageContainer, "storagecontainer");
}

void registerConfigLumo(NamespacePtr const &lumo) {
    NamespacePtr const configLumo = makeNamespace("Operations pertaining to config-lumos.");
    configLumo->RegisterNamespaceNode(ConfigLumoAdd::New(), "add");
    configLumo->RegisterNamespaceNode(ConfigLumoRemove::New(), "remove");
    configLumo->RegisterNamespaceNode(ConfigLumoUmountdir::New(), "umount");
    configLumo->RegisterNamespaceNode(ConfigLumoMountdir::New(), "mount");
    lumo->RegisterNamespaceNode(configLumo, "configlumo");
}

void registerDaemon(NamespacePtr const &lumo) {
    NamespacePtr const daemon =
        makeNamespace("Operations pertaining to Lumo daemon to  set LogLevel,unbind timer and dump objects.");
    daemon->RegisterNamespaceNode(DaemonCommand::New(), "set");
    lumo->RegisterNamespaceNode(daemon, "daemon");
}

void registerOrkaContext(NamespacePtr const &lumo) {
    NamespacePtr const orkaContext = makeNamespace("Operations on the Lumo Orka context.");
    orkaContext->RegisterNamespaceNode(OrkaContextSet::New(), "set");
    lumo->RegisterNamespaceNode(orkaContext, "orkacontext");
}

void registerVirtualVolume(NamespacePtr const &lumo) {
    NamespacePtr const virtualVolume = makeNamespace("Operations on a specific virtual volume.");
    virtualVolume->RegisterNamespaceNode(VirtualVolumeGet::New(), "get");
    NamespacePtr const metadata = makeNamespace("Operations on the metadata for a specific virtual volume.");
    metadata->RegisterNamespaceNode(VirtualVolumeMetaDataList::New(), "list");
    virtualVolume->RegisterNamespaceNode(metadata, "metadata");
    lumo->RegisterNamespaceNode(virtualVolume, "virtualvolume");
}

void registerLumo(NamespacePtr const &internal) {
    NamespacePtr const lumo = makeNamespace("Operations pertaining to Virtual Volumes");
    registerOrkaProvider(lumo);
    registerFaultInjection(lumo);
    registerStorageContainer(lumo);
    registerConfigLumo(lumo);
    registerDaemon(lumo);
    registerOrkaContext(lumo);
    registerVirtualVolume(lumo);
    internal->RegisterNamespaceNode(lumo, "lumo");
}

} // namespace
} // namespace TarselCli::LumoNamespace

void AutoCli_RegisterNamespaces(NamespacePtr &root) {
    if (!root->HasNamespaceNode("storage")) {
        throw Gantry::Lib::GantryException("Unable to find 'storage' namespace in namespace '" + root->GetName() + "'",
                                           Gantry::Lib::QuibMessage());
    }
    auto const storage = boost::dynamic_pointer_cast<Namespace>(root->GetNamespaceNode("storage"));
    NamespacePtr internal;
    // Other plug-ins hang into "internal" too; whoever comes first makes it.
    if (storage->HasNamespaceNode("internal")) {
        internal = boost::dynamic_pointer_cast<Namespace>(storage->GetNamespaceNode("internal"));
    } else {
        internal = TarselCli::LumoNamespace::makeNamespace("Tarsel internal storage commands.");
        storage->RegisterNamespaceNode(internal, "internal");
    }
    TarselCli::LumoNamespace::registerLumo(internal);
}
