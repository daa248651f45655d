// SPDX-License-Identifier: Apache-2.0
#include "wire/ErrorCode.h"

namespace Wire {

char const *textOf(int32_t code) noexcept {
    switch (static_cast<ErrorCode>(code)) {
    case ErrorCode::Success:
        return "success";
    case ErrorCode::InvalidRequest:
        return "the request is malformed";
    case ErrorCode::UnsupportedVersion:
        return "the peer speaks another protocol version";
    case ErrorCode::UnknownMethod:
        return "the daemon does not know this request";
    case ErrorCode::MessageTooLarge:
        return "the message is larger than allowed";
    case ErrorCode::ProtocolError:
        return "the peer broke the protocol";
    case ErrorCode::NotPermitted:
        return "not permitted";
    case ErrorCode::InternalError:
        return "internal error";
    case ErrorCode::OutOfMemory:
        return "out of memory";
    case ErrorCode::DaemonNotRunning:
        return "the daemon is not running";
    case ErrorCode::ConnectionLost:
        return "the connection to the daemon was lost";
    case ErrorCode::DeadlineExceeded:
        return "no answer before the deadline";
    case ErrorCode::ShuttingDown:
        return "the daemon is shutting down";
    case ErrorCode::NoSession:
        return "no session is open";
    case ErrorCode::InvalidArgument:
        return "invalid argument";
    case ErrorCode::NoSuchProvider:
        return "no such provider";
    case ErrorCode::NoSuchArray:
        return "no such storage array";
    case ErrorCode::NoSuchContainer:
        return "no such storage container";
    case ErrorCode::NoSuchVolume:
        return "no such virtual volume";
    case ErrorCode::NoSuchEndpoint:
        return "no such protocol endpoint";
    case ErrorCode::AlreadyExists:
        return "already exists";
    case ErrorCode::InUse:
        return "in use";
    case ErrorCode::TooLarge:
        return "larger than the container allows";
    case ErrorCode::ProviderUnreachable:
        return "the provider cannot be reached";
    case ErrorCode::ProviderOffline:
        return "the provider is offline";
    case ErrorCode::NoActiveProvider:
        return "no active provider serves the array";
    case ErrorCode::NoAccessibleEndpoint:
        return "no protocol endpoint is accessible";
    case ErrorCode::NotTheActiveProvider:
        return "another provider is active for the array";
    case ErrorCode::ProviderBusy:
        return "the provider is busy";
    case ErrorCode::FileMissing:
        return "the file does not exist";
    case ErrorCode::FileMalformed:
        return "the file is malformed";
    case ErrorCode::FileForeign:
        return "the file belongs to another program";
    case ErrorCode::FileNewer:
        return "the file was written by a newer version";
    case ErrorCode::FileBusy:
        return "the file is locked by another process";
    case ErrorCode::FileReadOnly:
        return "the file cannot be written";
    case ErrorCode::DiskFull:
        return "the disk is full";
    case ErrorCode::IoError:
        return "input/output error";
    case ErrorCode::UnknownFault:
        return "unknown fault";
    case ErrorCode::UnknownOperation:
        return "unknown operation";
    case ErrorCode::IllegalFault:
        return "the fault is not legal for the operation";
    case ErrorCode::RuleExists:
        return "the rule exists";
    case ErrorCode::NoSuchRule:
        return "no such rule";
    case ErrorCode::FaultStorageFault:
        return "STORAGE_FAULT";
    case ErrorCode::FaultOutOfResource:
        return "OUT_OF_RESOURCE";
    case ErrorCode::FaultResourceBusy:
        return "RESOURCE_BUSY";
    case ErrorCode::FaultPermissionDenied:
        return "PERMISSION_DENIED";
    case ErrorCode::FaultNotFound:
        return "NOT_FOUND";
    case ErrorCode::FaultTimeout:
        return "TIMEOUT";
    case ErrorCode::FaultLostSession:
        return "LOST_SESSION";
    }
    return nullptr;
}

} // namespace Wire
