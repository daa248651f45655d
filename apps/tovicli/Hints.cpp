// SPDX-License-Identifier: Apache-2.0
#include "Hints.h"

#include "wire/ErrorCode.h"

namespace Tovicli {

std::string hintFor(int32_t code, std::string const &root, std::string const &requestId) {
    // Where the daemon's log knows more than could be answered.
    std::string const inLog = "see " + root + "/log/lumod.log, request " + requestId;
    switch (static_cast<Wire::ErrorCode>(code)) {
    case Wire::ErrorCode::DaemonNotRunning:
        return "start it with 'lumod --root " + root + "'";
    case Wire::ErrorCode::DeadlineExceeded:
        return "--timeout gives it more time";
    case Wire::ErrorCode::ConnectionLost:
    case Wire::ErrorCode::ProtocolError:
    case Wire::ErrorCode::ProviderUnreachable:
        return inLog;
    case Wire::ErrorCode::UnsupportedVersion:
    case Wire::ErrorCode::UnknownMethod:
        return "tovicli and lumod are of different releases; restart lumod after an update";
    case Wire::ErrorCode::ShuttingDown:
        return "try again when lumod is running again";
    case Wire::ErrorCode::ProviderOffline:
        return "'orkaprovider injectfault' without --status takes an injected state back";
    case Wire::ErrorCode::NoActiveProvider:
        return "'orkaprovider activate' makes a provider the array's active one";
    case Wire::ErrorCode::FileForeign:
        return "it was left as it is; move it elsewhere if it is not needed";
    case Wire::ErrorCode::FileNewer:
        return "it was left as it is; use the newer release that wrote it";
    case Wire::ErrorCode::FileBusy:
    case Wire::ErrorCode::ProviderBusy:
        return "try again when the other one is done";
    case Wire::ErrorCode::DiskFull:
        return "make room and try again";
    case Wire::ErrorCode::RuleExists:
        return "'faultInjection rule set' changes a rule";
    case Wire::ErrorCode::NoSuchRule:
        return "'faultInjection rule add' makes a rule";
    default:
        return {};
    }
}

} // namespace Tovicli
