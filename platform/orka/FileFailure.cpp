// SPDX-License-Identifier: Apache-2.0
#include "FileFailure.h"

namespace Orka {

namespace {

Wire::ErrorCode codeOf(Sqlite::ErrorKind kind) {
    switch (kind) {
    case Sqlite::ErrorKind::Missing:
        return Wire::ErrorCode::FileMissing;
    case Sqlite::ErrorKind::Malformed:
        return Wire::ErrorCode::FileMalformed;
    case Sqlite::ErrorKind::Foreign:
        return Wire::ErrorCode::FileForeign;
    case Sqlite::ErrorKind::Newer:
        return Wire::ErrorCode::FileNewer;
    case Sqlite::ErrorKind::Busy:
        return Wire::ErrorCode::FileBusy;
    case Sqlite::ErrorKind::ReadOnly:
        return Wire::ErrorCode::FileReadOnly;
    case Sqlite::ErrorKind::DiskFull:
        return Wire::ErrorCode::DiskFull;
    case Sqlite::ErrorKind::Io:
        return Wire::ErrorCode::IoError;
    case Sqlite::ErrorKind::Constraint:
    case Sqlite::ErrorKind::Other:
        return Wire::ErrorCode::InternalError;
    }
    return Wire::ErrorCode::InternalError;
}

} // namespace

Wire::Failure failureOf(Sqlite::Error const &error) {
    return {codeOf(error.kind()), error.sentence()};
}

} // namespace Orka
