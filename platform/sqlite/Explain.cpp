// SPDX-License-Identifier: Apache-2.0
#include "Explain.h"

#include <cerrno>
#include <new>
#include <system_error>

#include <sqlite3.h>

#include "GuardedFiles.h"

namespace Sqlite {
namespace {

std::string systemWords(int systemError, char const *otherwise) {
    return systemError == 0 ? std::string(otherwise) : std::generic_category().message(systemError);
}

Error diskFull(std::string const &name) {
    return Error(ErrorKind::DiskFull, name + " cannot be written: the disk is full; it was not changed");
}

Error explainIo(int code, int systemError, char const *detail, std::string const &name) {
    if (code == SQLITE_IOERR_NOMEM) {
        throw std::bad_alloc();
    }
    if (code == SQLITE_IOERR_DIR_FSYNC) {
        // The journal is gone, so the change is there for everybody; only a power cut may still take it back.
        return Error(ErrorKind::Io, name + " was changed, but perhaps not durably: " +
                                        systemWords(systemError, "its directory cannot be synced"));
    }
    if (systemError == ENOSPC || systemError == EDQUOT) {
        return diskFull(name);
    }
    std::string action = " cannot be read or written: ";
    if (code == SQLITE_IOERR_FSYNC) {
        action = " cannot be written durably: ";
    } else if (code == SQLITE_IOERR_READ || code == SQLITE_IOERR_SHORT_READ) {
        action = " cannot be read: ";
    }
    return Error(ErrorKind::Io, name + action + systemWords(systemError, detail));
}

Error explainCannotOpen(int code, int systemError, char const *detail, std::string const &name) {
    switch (code) {
    case codeNoRegularFile:
        return Error(ErrorKind::Io,
                     name + " cannot be used: what lies beside it in the place of its journal is no regular file");
    case codeNamesAnotherFile:
        return Error(ErrorKind::Io, name + " cannot be used: the journal beside it named another file to remove, as "
                                           "none of ours does; that file was left alone");
    default:
        return Error(systemError == ENOENT ? ErrorKind::Missing : ErrorKind::Io,
                     name + " cannot be opened: " + systemWords(systemError, detail));
    }
}

} // namespace

std::string named(std::string const &kindName, std::string const &path) {
    return (kindName.empty() ? "the database" : kindName) + " '" + path + '\'';
}

Error explain(int code, int systemError, char const *detail, std::string const &name,
              std::chrono::milliseconds busyTimeout) {
    switch (code & 0xff) {
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return Error(ErrorKind::Busy, busyTimeout.count() == 0
                                          ? name + " is busy: another process is changing it"
                                          : name + " is busy: another process has held its lock for " +
                                                std::to_string(busyTimeout.count()) + " ms");
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
        return Error(ErrorKind::Malformed, name + " is damaged: " + detail);
    case SQLITE_READONLY:
    case SQLITE_PERM:
        return Error(ErrorKind::ReadOnly,
                     name + " cannot be written: it, its directory or its file system is read-only");
    case SQLITE_FULL:
        return diskFull(name);
    case SQLITE_IOERR:
        return explainIo(code, systemError, detail, name);
    case SQLITE_CANTOPEN:
        return explainCannotOpen(code, systemError, detail, name);
    case SQLITE_TOOBIG:
        return Error(ErrorKind::Malformed, name + " cannot be used: a row of it is longer than " +
                                               std::to_string(rowBytesMax >> 20) + " MiB");
    case SQLITE_CONSTRAINT:
        return Error(ErrorKind::Constraint, name + " refuses the change: " + detail);
    case SQLITE_NOMEM:
        throw std::bad_alloc();
    default:
        return Error(ErrorKind::Other, name + " cannot be used: " + detail);
    }
}

} // namespace Sqlite
