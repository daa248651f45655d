// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

ReplyPtr setFaultInjectionEnabled(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    bool const enabled = request.getSetFaultInjectionEnabled();
    core.faults.setEnabled(enabled);
    core.log.write(LogLevel::Warning, call->trace,
                   enabled ? "fault injection is enabled" : "fault injection is disabled");
    return doneReply();
}

} // namespace Lumod
