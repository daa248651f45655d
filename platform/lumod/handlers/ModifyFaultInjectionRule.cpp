// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

namespace Lumod {

ReplyPtr modifyFaultInjectionRule(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::FaultInjectionRule::Reader const rule = request.getModifyFaultInjectionRule();
    std::string const fault = textOf(rule.getFault());
    std::string const operation = textOf(rule.getOperation());
    core.faults.modify(fault, operation, rule.getFrequency(), rule.getTimeMs());
    core.log.write(LogLevel::Info, call->trace,
                   rule.getFrequency() <= 0 && rule.getTimeMs() <= 0
                       ? fmt::format("removed the fault rule {} for {}", fault, operation)
                       : fmt::format("changed the fault rule {} for {}: frequency {}, time {} ms", fault, operation,
                                     rule.getFrequency(), rule.getTimeMs()));
    return doneReply();
}

} // namespace Lumod
