// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

namespace Lumod {

ReplyPtr addFaultInjectionRule(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::FaultInjectionRule::Reader const rule = request.getAddFaultInjectionRule();
    std::string const fault = textOf(rule.getFault());
    std::string const operation = textOf(rule.getOperation());
    core.faults.add(fault, operation, rule.getFrequency(), rule.getTimeMs());
    core.log.write(LogLevel::Info, call->trace,
                   fmt::format("added the fault rule {} for {}: frequency {}, time {} ms", fault, operation,
                               rule.getFrequency(), rule.getTimeMs()));
    return doneReply();
}

} // namespace Lumod
