// SPDX-License-Identifier: Apache-2.0
#include "sqlite/Database.h"

#include <cerrno>
#include <utility>

#include <SQLiteCpp/SQLiteCpp.h>
#include <fcntl.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include "Explain.h"
#include "Header.h"
#include "sqlite/Transaction.h"

namespace Sqlite {
namespace {

/// 0 when there is a regular file, errno or the nearest word for it otherwise.
int whyNotOpen(std::string const &path) {
    struct stat status {};
    if (::stat(path.c_str(), &status) != 0) {
        return errno;
    }
    return S_ISDIR(status.st_mode) ? EISDIR : S_ISREG(status.st_mode) ? 0 : EINVAL;
}

/// True also when there is no such directory.
bool mayMakeFileBeside(std::string const &path) {
    auto const slash = path.rfind('/');
    std::string const directory = slash == std::string::npos ? "." : path.substr(0, slash + 1);
    return ::faccessat(AT_FDCWD, directory.c_str(), W_OK | X_OK, AT_EACCESS) == 0 || errno == ENOENT;
}

bool exists(char const *path) {
    struct stat status {};
    return path != nullptr && ::lstat(path, &status) == 0;
}

/// SQLite takes some names for something other than a file (":memory:", "file:..."); one with a slash is always a file.
std::string fileName(std::string const &path) {
    return !path.empty() && path.front() == '/' ? path : "./" + path;
}

} // namespace

Database::Database(std::string const &path, Identity const &identity, Mode mode, Options const &options)
    : path_(path)
    , identity_(identity)
    , mode_(mode)
    , busyTimeout_(options.busyTimeout) {
    if (path.empty() || path.find('\0') != std::string::npos) {
        throw Error(ErrorKind::Missing, named(identity.kindName, path) + " cannot be opened: no such file name");
    }
    open(options, false);
    try {
        checkIdentity();
        configure();
    } catch (SQLite::Exception const &cause) {
        fail(cause);
    }
}

Database::~Database() = default;

void Database::open(Options const &options, bool openedAgain) {
    int flags = SQLite::OPEN_READWRITE | SQLite::OPEN_NOMUTEX;
    if (mode_ == Mode::Create) {
        flags |= SQLite::OPEN_CREATE;
    }
    try {
        handle_ =
            std::make_unique<SQLite::Database>(fileName(path_), flags, static_cast<int>(options.busyTimeout.count()));
        sqlite3_extended_result_codes(handle_->getHandle(), 1);
    } catch (SQLite::Exception const &cause) {
        int const reason = whyNotOpen(path_);
        if (reason == 0 && cause.getErrorCode() == SQLITE_CANTOPEN && !openedAgain) {
            // There is a file by now: another process has made it since SQLite looked.
            open(options, true);
            return;
        }
        if (reason == ENOENT && mode_ != Mode::Create) {
            throw Error(ErrorKind::Missing, named(identity_.kindName, path_) + " does not exist");
        }
        if (reason == ENOENT && !mayMakeFileBeside(path_)) {
            throw Error(ErrorKind::ReadOnly, named(identity_.kindName, path_) +
                                                 " cannot be made: its directory or its file system is read-only");
        }
        throw explain(cause.getExtendedErrorCode(), reason, cause.what(), named(identity_.kindName, path_),
                      busyTimeout_);
    }
}

void Database::checkIdentity() {
    auto const name = [this] { return named(identity_.kindName, path_); };
    Header header = readHeader(handle_->getHandle());
    bool const maybeOurs = header.kind == Header::Kind::Zeros ||
                           (header.kind == Header::Kind::Database && header.applicationId == identity_.applicationId);
    // Asked after the header was read: a journal that is gone by now had committed what the header says.
    char const *const journal = sqlite3_filename_journal(sqlite3_db_filename(handle_->getHandle(), "main"));
    if (maybeOurs && exists(journal)) {
        // Any read rolls back what a killed process left, which may be all there is: its first transaction.
        Query(*this, "SELECT count(*) FROM sqlite_schema").step();
        header = readHeader(handle_->getHandle());
    }
    if (header.kind == Header::Kind::Empty) {
        if (mode_ != Mode::Create) {
            throw Error(ErrorKind::Missing, name() + " has no content yet");
        }
        createLayout();
        header = readHeader(handle_->getHandle());
    }
    if (header.kind != Header::Kind::Database) {
        throw Error(ErrorKind::Malformed, name() + " is damaged: it does not begin as a database file does");
    }
    if (header.applicationId != identity_.applicationId) {
        throw Error(ErrorKind::Foreign, name() + " belongs to another program (application id " +
                                            std::to_string(header.applicationId) + "); it was left as it is");
    }
    if (header.userVersion > identity_.userVersion) {
        throw Error(ErrorKind::Newer, name() + " was written by a newer version (layout " +
                                          std::to_string(header.userVersion) + ", this program knows " +
                                          std::to_string(identity_.userVersion) + "); it was left as it is");
    }
    if (header.userVersion != identity_.userVersion) {
        throw Error(ErrorKind::Malformed,
                    name() + " is damaged: it says layout " + std::to_string(header.userVersion) + ", which never was");
    }
}

void Database::createLayout() {
    handle_->exec("PRAGMA journal_mode=DELETE; PRAGMA synchronous=EXTRA");
    Transaction transaction(*this);
    // Two processes may have found the file empty; the second one finds the layout made.
    Query tables(*this, "SELECT count(*) FROM sqlite_schema");
    tables.step();
    if (tables.integer(0) != 0) {
        return;
    }
    tables.reset();
    handle_->exec("PRAGMA application_id=" + std::to_string(identity_.applicationId));
    handle_->exec("PRAGMA user_version=" + std::to_string(identity_.userVersion));
    handle_->exec(identity_.schema);
    transaction.commit();
}

void Database::configure() {
    handle_->exec("PRAGMA journal_mode=DELETE;"
                  "PRAGMA synchronous=EXTRA;"
                  "PRAGMA foreign_keys=ON;"
                  "PRAGMA temp_store=MEMORY;"
                  "PRAGMA cell_size_check=ON;"
                  "PRAGMA trusted_schema=OFF");
    if (mode_ == Mode::QueryOnly) {
        handle_->exec("PRAGMA query_only=ON");
    }
}

Query Database::query(std::string_view sql) {
    return Query(*this, sql);
}

void Database::execute(std::string const &sql) {
    try {
        handle_->exec(sql);
    } catch (SQLite::Exception const &cause) {
        fail(cause);
    }
}

int64_t Database::lastInsertId() const {
    return handle_->getLastInsertRowid();
}

int64_t Database::changes() const {
    return handle_->getChanges();
}

int64_t Database::dataVersion() {
    Query version(*this, "PRAGMA data_version");
    version.step();
    return version.integer(0);
}

bool Database::hasMoved() const {
    int moved = 0;
    sqlite3_file_control(handle_->getHandle(), "main", SQLITE_FCNTL_HAS_MOVED, &moved);
    return moved != 0;
}

bool Database::isReadOnly() const {
    return mode_ == Mode::QueryOnly || sqlite3_db_readonly(handle_->getHandle(), "main") == 1;
}

void Database::checkIntegrity() {
    Query check(*this, "PRAGMA quick_check(1)");
    if (check.step() && check.textView(0) != "ok") {
        throw Error(ErrorKind::Malformed, named(identity_.kindName, path_) + " is damaged: " + check.text(0));
    }
}

Database::Statement Database::take(std::string_view sql) {
    if (auto const found = idle_.find(sql); found != idle_.end() && !found->second.empty()) {
        Statement statement = std::move(found->second.back());
        found->second.pop_back();
        return statement;
    }
    try {
        return std::make_unique<SQLite::Statement>(*handle_, std::string(sql));
    } catch (SQLite::Exception const &cause) {
        fail(cause);
    }
}

void Database::giveBack(Statement statement) noexcept {
    try {
        statement->tryReset();
        statement->clearBindings();
        idle_[statement->getQuery()].push_back(std::move(statement));
    } catch (std::exception const &) {
        // Not kept, then: it is prepared again next time.
    }
}

void Database::fail(SQLite::Exception const &cause) const {
    int const systemError = sqlite3_system_errno(handle_->getHandle());
    std::string const name = named(identity_.kindName, path_);
    if (cause.getErrorCode() == SQLITE_CANTOPEN && whyNotOpen(path_) == 0) {
        // The file is open; it is its journal that cannot be. SQLite has tried to read one then, so that its error says
        // that there is none.
        if (!mayMakeFileBeside(path_)) {
            throw explain(SQLITE_READONLY, systemError, cause.what(), name, busyTimeout_);
        }
        throw Error(ErrorKind::Io, name + " cannot be written: its journal cannot be made");
    }
    throw explain(cause.getExtendedErrorCode(), systemError, cause.what(), name, busyTimeout_);
}

} // namespace Sqlite
