// SPDX-License-Identifier: Apache-2.0
#include "Declarations.h"

#include "ConfigLumoAdd.h"
#include "ConfigLumoMountdir.h"
#include "ConfigLumoRemove.h"
#include "ConfigLumoUmountdir.h"
#include "StorageContainerAdd.h"
#include "StorageContainerCheckLumos.h"
#include "StorageContainerLoad.h"
#include "StorageContainerRemove.h"

using namespace TarselCli::LumoNamespace;

namespace PluginTest {

std::vector<Declaration> containerDeclarations() {
    return {
        {"StorageContainerLoad",
         StorageContainerLoad::New,
         "storage internal lumo storagecontainer load",
         "Load All the Lumo StorageContainers exported by the VP.",
         "operation",
         "simple",
         {{"header:StorageContainer", "%StorageContainer Name%"},
          {"header:Array", "%ArrayId%"},
          {"table-columns", "StorageContainer Name,StorageContainer Id,Max Lumo Size (MB),VP URL,Arrays"}},
         {},
         "list of StorageContainer{StorageContainer Name: string, StorageContainer Id: string, Max Lumo Size (MB): "
         "int, VP URL: string, Arrays: list of Array{ArrayId: string, Name: string, VendorId: string, ModelId: string, "
         "PEInfo: list of strings}}",
         42},
        {"StorageContainerAdd",
         StorageContainerAdd::New,
         "storage internal lumo storagecontainer add",
         "Add a new Lumo StorageContainer to the Tovi Host and mount it with the given volume name.",
         "operation",
         "",
         {},
         {"container-name n string required: StorageContainer Name",
          "container-id c string required: StorageContainer ID", "array a strings optional: List of Array UUID"},
         "bool",
         0},
        {"StorageContainerRemove",
         StorageContainerRemove::New,
         "storage internal lumo storagecontainer remove",
         "Remove given Lumo StorageContainer from Tovi host",
         "operation",
         "",
         {},
         {"container-id c string required: StorageContainer ID"},
         "bool",
         31},
        {"StorageContainerCheckLumos",
         StorageContainerCheckLumos::New,
         "storage internal lumo storagecontainer checklumos",
         "Check availability of given Lumos in a StorageContainer",
         "operation",
         "table",
         {{"fields:LumosAreAccessible", "LumoId,Status"}},
         {"path p string required: Lumo datastore path", "lumo v strings optional: Lumo Uuid"},
         "list of LumosAreAccessible{LumoId: string, Status: string}",
         40},
        {"ConfigLumoAdd",
         ConfigLumoAdd::New,
         "storage internal lumo configlumo add",
         "ConfigLumoAdd a config Lumo in a given Lumo StorageContainer.",
         "operation",
         "",
         {},
         {"name n string required: Directory Name", "container-id c string required: StorageContainer ID",
          "size s integer optional: Size of the meta-lumo object in MB",
          "policy p string optional: Policy string for meta-lumo object",
          "vmuuid v string optional: VM Uuid string for meta-lumo object",
          "policy-file f string optional: Policy file for meta-lumo object",
          "priority - flag optional: Use priority socket to allow out-of-order execution of this request"},
         "bool",
         0},
        {"ConfigLumoRemove",
         ConfigLumoRemove::New,
         "storage internal lumo configlumo remove",
         "Unmount and delete a given config Lumo.",
         "operation",
         "",
         {},
         {"name n string optional: Directory Path", "container-id c string required: StorageContainer ID",
          "uuid u string optional: meta-lumo UUID",
          "priority - flag optional: Use priority socket to allow out-of-order execution of this request"},
         "bool",
         0},
        {"ConfigLumoUmountdir",
         ConfigLumoUmountdir::New,
         "storage internal lumo configlumo umount",
         "Unmount a given Config Lumo from the Tovi file system",
         "operation",
         "",
         {},
         {"name n string optional: Directory Name", "container-id c string required: StorageContainer ID",
          "uuid u string optional: meta-lumo UUID",
          "priority - flag optional: Use priority socket to allow out-of-order execution of this request"},
         "bool",
         0},
        {"ConfigLumoMountdir",
         ConfigLumoMountdir::New,
         "storage internal lumo configlumo mount",
         "Mount a given config Lumo as directory in the Tovi file system",
         "operation",
         "",
         {},
         {"name n string optional: Directory Name", "container-id c string required: StorageContainer ID",
          "uuid u string optional: meta-lumo UUID",
          "priority - flag optional: Use priority socket to allow out-of-order execution of this request"},
         "bool",
         0},
    };
}

} // namespace PluginTest
