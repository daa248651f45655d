// SPDX-License-Identifier: Apache-2.0
//
// The one table of error codes: the daemon sends them, the client library returns them, LumoLib_Err2String turns them
// into text. Numbers are part of the wire: add at the end of a group, never reuse one.
#pragma once

#include <cstdint>

namespace Wire {

enum class ErrorCode : int32_t {
    Success = 0,

    // The conversation itself.
    InvalidRequest = 1,
    UnsupportedVersion = 2,
    UnknownMethod = 3,
    MessageTooLarge = 4,
    ProtocolError = 5,
    NotPermitted = 6,
    InternalError = 7,
    OutOfMemory = 8,

    // The daemon.
    DaemonNotRunning = 10,
    ConnectionLost = 11,
    DeadlineExceeded = 12,
    ShuttingDown = 13,
    NoSession = 14,

    // What a request names.
    InvalidArgument = 20,
    NoSuchProvider = 21,
    NoSuchArray = 22,
    NoSuchContainer = 23,
    NoSuchVolume = 24,
    NoSuchEndpoint = 25,
    AlreadyExists = 26,
    InUse = 27,
    TooLarge = 28,

    // Providers and paths.
    ProviderUnreachable = 30,
    ProviderOffline = 31,
    NoActiveProvider = 32,
    NoAccessibleEndpoint = 33,
    NotTheActiveProvider = 34,
    ProviderBusy = 35,

    // Files of ours.
    FileMissing = 40,
    FileMalformed = 41,
    FileForeign = 42,
    FileNewer = 43,
    FileBusy = 44,
    FileReadOnly = 45,
    DiskFull = 46,
    IoError = 47,

    // Fault rules.
    UnknownFault = 60,
    UnknownOperation = 61,
    IllegalFault = 62,
    RuleExists = 63,
    NoSuchRule = 64,

    // Injected faults: what a provider would have answered.
    FaultStorageFault = 80,
    FaultOutOfResource = 81,
    FaultResourceBusy = 82,
    FaultPermissionDenied = 83,
    FaultNotFound = 84,
    FaultTimeout = 85,
    FaultLostSession = 86,
};

/// @return static text for a code, null for one that is not in the table.
char const *textOf(int32_t code) noexcept;

} // namespace Wire
