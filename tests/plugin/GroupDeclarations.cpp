// SPDX-License-Identifier: Apache-2.0
#include "Declarations.h"

#include "CGAdd.h"
#include "CGCreate.h"
#include "CGDelete.h"
#include "CGList.h"
#include "CGSync.h"

using namespace TarselCli::LumoNamespace;

namespace PluginTest {

std::vector<Declaration> groupDeclarations() {
    return {
        {"CGAdd",
         CGAdd::New,
         "",
         "Add the LumoIds to Consistency Group",
         "operation",
         "",
         {},
         {"cgid c string required: Consistency Group ID to which lumos are to be added",
          "lumoids v strings required: List of LumoIDs.",
          "vp-name n string required: Name of the VP which the Tovi is registered to."},
         "bool",
         35},
        {"CGCreate",
         CGCreate::New,
         "",
         "Create a Consistency Group.",
         "operation",
         "table",
         {{"fields:GCreate", "Name,Description,Id,DestinationArrayId,FailoverArrayId,SourceArrayId,State"}},
         {"name n string required: Consistency Group Name", "desc d string required: Consistency Group Description",
          "profile p string required: Profile ID as advertised by VP",
          "vp-name v string required: Name of the VP which Tovi host is registered to"},
         "CGCreate{Name: string, Description: string, Id: string, DestinationArrayId: string, FailoverArrayId: string, "
         "SourceArrayId: string, State: string}",
         47},
        {"CGDelete",
         CGDelete::New,
         "",
         "Delete the Consistency Group",
         "operation",
         "simple",
         {},
         {"cgid c string required: ID of Consistency Group to be deleted", "vp-name v string required: Name of the VP"},
         "bool",
         37},
        {"CGList",
         CGList::New,
         "",
         "List Consistency Group IDs.",
         "fetcher",
         "table",
         {{"fields:CGList",
           "CgId,Name,Description,DestinationArrayId,FailOverArrayId,SourceArrayId,State,Warning,Error"}},
         {"cgid c strings required: List of CG IDs.",
          "vp-name n string required: Name of the VP which Tovi is registered."},
         "list of CGList{CgId: string, Name: string, Description: string, DestinationArrayId: string, FailOverArrayId: "
         "string, SourceArrayId: string, State: string, Warning: string, Error: string}",
         0},
        {"CGSync",
         CGSync::New,
         "",
         "Sync Consistency Group IDs.",
         "operation",
         "simple",
         {{"header:CgSync", "%CgId%"}, {"fields:CGSync", "CgId,RpId,TimeStamp,Warning,Error"}},
         {"cgid c strings required: List of CG IDs.",
          "vp-name n string required: Name of the VP which Host is registered."},
         "list of CGSync{CgId: string, RpId: string, TimeStamp: string, Warning: string, Error: string}",
         52},
    };
}

} // namespace PluginTest
