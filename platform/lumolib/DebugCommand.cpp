// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

using namespace LumoClient;

namespace {

/// On the wire a negative number means that the setting stays, so a negative setting has to be refused here.
std::int64_t setting(std::int32_t const *value, char const *name) {
    if (value != nullptr && *value < 0) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            std::string(name) + " must not be negative: " + std::to_string(*value));
    }
    return value != nullptr ? *value : -1;
}

} // namespace

int32_t LumoLib_DebugCommand(int32_t const *logLevel, int32_t const *dump, int32_t const *unbindPeriodUs) {
    return answer([=](Connection &connection) {
        std::int64_t const level = setting(logLevel, "the log level");
        std::int64_t const dumping = setting(dump, "the dump request");
        std::int64_t const period = setting(unbindPeriodUs, "the unbind period");
        connection.change([=](Compact::Request::Builder request) {
            Compact::DebugCommand::Builder command = request.initDebugCommand();
            command.setLogLevel(level);
            command.setDump(dumping);
            command.setUnbindPeriodUs(period);
        });
    });
}

int32_t LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(uint8_t enabled) {
    return answer([=](Connection &connection) {
        connection.change(
            [=](Compact::Request::Builder request) { request.setSetSpaceEfficiencyManipulationEnabled(enabled != 0); });
    });
}
