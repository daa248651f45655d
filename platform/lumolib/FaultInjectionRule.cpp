// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

using namespace LumoClient;

namespace {

void fillRule(Compact::FaultInjectionRule::Builder rule, char const *fault, char const *operation,
              std::int32_t frequency, std::int32_t timeMs) {
    rule.setFault(argument(fault));
    rule.setOperation(argument(operation));
    rule.setFrequency(frequency);
    rule.setTimeMs(timeMs);
}

} // namespace

bool LumoLib_SetFaultInjectionEnabled(bool enabled) {
    return answer([=](Connection &connection) {
               connection.change(
                   [=](Compact::Request::Builder request) { request.setSetFaultInjectionEnabled(enabled); });
           }) == 0;
}

bool LumoLib_AddFaultInjectionRule(char const *fault, char const *operation, int32_t frequency, int32_t timeMs) {
    return answer([=](Connection &connection) {
               connection.change([=](Compact::Request::Builder request) {
                   fillRule(request.initAddFaultInjectionRule(), fault, operation, frequency, timeMs);
               });
           }) == 0;
}

bool LumoLib_ModifyFaultInjectionRule(char const *fault, char const *operation, int32_t frequency, int32_t timeMs) {
    return answer([=](Connection &connection) {
               connection.change([=](Compact::Request::Builder request) {
                   fillRule(request.initModifyFaultInjectionRule(), fault, operation, frequency, timeMs);
               });
           }) == 0;
}
