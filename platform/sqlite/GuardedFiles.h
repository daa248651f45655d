// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace Sqlite {

/// Extended result codes (SQLITE_CANTOPEN in their lowest byte) with which an open of SQLite's own is refused.
enum : int {
    codeNoRegularFile = 14 | (201 << 8),
    codeNamesAnotherFile = 14 | (202 << 8),
};

/// The name of the file system through which SQLite opens files that somebody else may have put where they are: the
/// default one, but for two things that a file's journal could have a process do. It opens no super-journal, which
/// SQLite would delete when the journal that names it is rolled back: we attach no database, so no journal of ours
/// names one. And it waits for nobody at the other end of a pipe.
char const *guardedFiles();

} // namespace Sqlite
