// SPDX-License-Identifier: Apache-2.0
#include "Translate.h"

#include <gtest/gtest.h>

namespace {

using Sqlite::ErrorKind;
using Wire::ErrorCode;

TEST(Translate, EveryKindHasItsCodeAndKeepsItsSentence) {
    constexpr std::pair<ErrorKind, ErrorCode> pairs[] = {
        {ErrorKind::Missing, ErrorCode::FileMissing},
        {ErrorKind::Malformed, ErrorCode::FileMalformed},
        {ErrorKind::Foreign, ErrorCode::FileForeign},
        {ErrorKind::Newer, ErrorCode::FileNewer},
        {ErrorKind::Busy, ErrorCode::FileBusy},
        {ErrorKind::ReadOnly, ErrorCode::FileReadOnly},
        {ErrorKind::DiskFull, ErrorCode::DiskFull},
        {ErrorKind::Io, ErrorCode::IoError},
        {ErrorKind::Constraint, ErrorCode::InternalError},
        {ErrorKind::Other, ErrorCode::InternalError},
    };
    for (auto const &[kind, code] : pairs) {
        Wire::Failure const failure = Store::toFailure(Sqlite::Error(kind, "a sentence"));
        EXPECT_EQ(failure.code(), code) << static_cast<int>(kind);
        EXPECT_EQ(failure.sentence(), "a sentence");
    }
}

} // namespace
