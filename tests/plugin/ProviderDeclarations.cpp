// SPDX-License-Identifier: Apache-2.0
#include "Declarations.h"

#include "VendorProviderActivate.h"
#include "VendorProviderAdd.h"
#include "VendorProviderDeactivate.h"
#include "VendorProviderInjectFault.h"
#include "VendorProviderRemove.h"
#include "VendorProviderSet.h"

using namespace TarselCli::LumoNamespace;

namespace PluginTest {

std::vector<Declaration> providerDeclarations() {
    return {
        {"VendorProviderAdd",
         VendorProviderAdd::New,
         "storage internal lumo orkaprovider add",
         "Add a new Orka Provider on the host.",
         "operation",
         "simple",
         {},
         {"vp-name v string required: Orka Provider Name", "vp-url U string required: VP URL",
          "arrayid a strings optional: Array Id", "priority p integers optional: Priority",
          "isactive i booleans optional: Is Active"},
         "string",
         0},
        {"VendorProviderSet",
         VendorProviderSet::New,
         "storage internal lumo orkaprovider set",
         "Update an existing Orka Provider on the host.",
         "operation",
         "simple",
         {},
         {"vp-name v string required: Orka Provider Name", "arrayid a strings optional: Array Id",
          "priority p integers optional: Priority(integer). Should be specified with arrayId",
          "isactive i booleans optional: IsActive(Boolean value). Should be specified with arrayId"},
         "string",
         0},
        {"VendorProviderRemove",
         VendorProviderRemove::New,
         "storage internal lumo orkaprovider remove",
         "Unregister a Orka Provider from Tovi host.",
         "operation",
         "",
         {},
         {"vp-name v string required: Orka Provider Name"},
         "bool",
         35},
        {"VendorProviderActivate",
         VendorProviderActivate::New,
         "storage internal lumo orkaprovider activate",
         "Activate Orka Provider for a specified Array.",
         "operation",
         "",
         {},
         {"vp-name n string required: Name of the VP to be activated",
          "arrayid a string required: ID of the Array to be activated",
          "activevpurl u string optional: URL of current active VP."},
         "bool",
         36},
        {"VendorProviderDeactivate",
         VendorProviderDeactivate::New,
         "storage internal lumo orkaprovider deactivate",
         "Deactivate Orka Provider for a specified Array.",
         "operation",
         "",
         {},
         {"vp-name n string required: Name of the VP to be deactivated",
          "arrayid a string required: ID of the Array to be Deactivated"},
         "bool",
         36},
        {"VendorProviderInjectFault",
         VendorProviderInjectFault::New,
         "storage internal lumo orkaprovider injectfault",
         "Inject Orka Provider related fault in Lumod for debugging.",
         "operation",
         "simple",
         {},
         {"vp-name v string required: Orka Provider Name",
          "status s string optional: Connection Status of VP (online/offline/syncError/unknown)",
          "arrayid a strings optional: Array Id",
          "isactive i booleans optional: IsActive(Boolean value). Should be specified along with parameter arrayId"},
         "string",
         0},
    };
}

} // namespace PluginTest
