// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "ObjectDump.h"

namespace Lumod {

namespace {

int64_t requestedPeriod(int64_t microseconds) {
    if (microseconds > longestUnbindPeriodUs) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            fmt::format("{} us is longer than an unbind period may be; the longest is {} us, a year",
                                        microseconds, longestUnbindPeriodUs));
    }
    return microseconds;
}

LogLevel requestedLevel(int64_t number) {
    auto const level = logLevelOf(number);
    if (!level) {
        throw Wire::Failure(
            Wire::ErrorCode::InvalidArgument,
            fmt::format("{} is no log level; those are 1 (quiet), 2 (panic), 4 (error), 8 (warning), 16 (info), "
                        "32 (verbose), 64 (trivia)",
                        number));
    }
    return *level;
}

} // namespace

Answer<ReplyPtr> debugCommand(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::DebugCommand::Reader const command = request.getDebugCommand();
    int64_t const periodUs = requestedPeriod(command.getUnbindPeriodUs());
    if (command.getLogLevel() >= 0) {
        LogLevel const level = requestedLevel(command.getLogLevel());
        core.log.setLevel(level);
        core.log.writeAlways(call->trace, fmt::format("the log level is {}", nameOf(level)));
    }
    if (periodUs > 0) {
        core.unbindTimer.setPeriod(periodUs * kj::MICROSECONDS);
        core.log.write(LogLevel::Info, call->trace, fmt::format("the unbind period is {} us", periodUs));
    }
    auto unbound = periodUs == 0 ? core.unbindTimer.unbindAll(call) : Answer<Done>(Outcome<Done>(Done{}));
    bool const wantsDump = command.getDump() > 0;
    return andThen(std::move(unbound), [&core, call, wantsDump](Done) {
        if (wantsDump) {
            dumpObjects(core, call->trace);
        }
        return doneReply();
    });
}

} // namespace Lumod
