// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

ReplyPtr setSpaceEfficiencyManipulationEnabled(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    bool const enabled = request.getSetSpaceEfficiencyManipulationEnabled();
    core.services.modifiesProfiles = enabled;
    core.log.write(LogLevel::Info, call->trace,
                   enabled ? "storage profiles are modified for space efficiency"
                           : "storage profiles are left as they are given");
    return doneReply();
}

} // namespace Lumod
