// SPDX-License-Identifier: Apache-2.0
#include "sqlite/Database.h"

#include <cerrno>
#include <cstdlib>
#include <memory>
#include <new>
#include <utility>

#include <fcntl.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include "Explain.h"
#include "GuardedFiles.h"
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

std::string directoryOf(std::string const &path) {
    auto const slash = path.rfind('/');
    return slash == std::string::npos ? "." : path.substr(0, slash + 1);
}

/// True also when there is no such directory.
bool mayMakeFileBeside(std::string const &path) {
    return ::faccessat(AT_FDCWD, directoryOf(path).c_str(), W_OK | X_OK, AT_EACCESS) == 0 || errno == ENOENT;
}

bool exists(char const *path) {
    struct stat status {};
    return ::lstat(path, &status) == 0;
}

/// SQLite takes some names for something other than a file (":memory:", "file:..."); one with a slash is always a file.
std::string fileName(std::string const &path) {
    return path.front() == '/' ? path : "./" + path;
}

/// The same file by a name in which only the last part may be a link: SQLite refuses links anywhere or nowhere.
std::string nameWithoutLinks(std::string const &path) {
    std::unique_ptr<char, decltype(&std::free)> const directory(::realpath(directoryOf(path).c_str(), nullptr),
                                                                &std::free);
    return directory == nullptr ? path : directory.get() + path.substr(path.rfind('/'));
}

/// Before SQLite is used for the first time in the process: no statistics of memory, which take a lock at each
/// allocation, and no store of pages taken at once, twenty of which would be touched for a file that has fewer.
void settleMemory() {
    static bool const settled = [] {
        sqlite3_config(SQLITE_CONFIG_MEMSTATUS, 0);
        sqlite3_config(SQLITE_CONFIG_PAGECACHE, nullptr, 0, 0);
        return true;
    }();
    static_cast<void>(settled);
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
    checkIdentity();
    configure(options);
}

Database::~Database() = default;

void Database::Close::operator()(sqlite3 *handle) const noexcept {
    sqlite3_close(handle);
}

void Database::open(Options const &options, bool openedAgain) {
    settleMemory();
    int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX;
    if (mode_ == Mode::Create) {
        flags |= SQLITE_OPEN_CREATE;
    }
    std::string name = fileName(path_);
    if (options.refusesLink) {
        flags |= SQLITE_OPEN_NOFOLLOW;
        name = nameWithoutLinks(name);
    }
    sqlite3 *opened = nullptr; // also when it fails, to ask why
    int const code = sqlite3_open_v2(name.c_str(), &opened, flags, guardedFiles());
    handle_.reset(opened);
    if (code == SQLITE_OK) {
        sqlite3_extended_result_codes(opened, 1);
        sqlite3_busy_timeout(opened, static_cast<int>(options.busyTimeout.count()));
        if (identity_.isFromOthers) {
            sqlite3_limit(opened, SQLITE_LIMIT_LENGTH, rowBytesMax);
        }
        return;
    }
    if (sqlite3_extended_errcode(opened) == SQLITE_CANTOPEN_SYMLINK) {
        throw Error(ErrorKind::Io, named(identity_.kindName, path_) +
                                       " is a symbolic link, which is not followed; it was left as it is");
    }
    int const reason = whyNotOpen(path_);
    if (reason == 0 && code == SQLITE_CANTOPEN && !openedAgain) {
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
    if (reason == EINVAL) {
        throw Error(ErrorKind::Io, named(identity_.kindName, path_) + " cannot be opened: it is no regular file");
    }
    throw explain(sqlite3_extended_errcode(opened), reason, sqlite3_errmsg(opened), named(identity_.kindName, path_),
                  busyTimeout_);
}

void Database::checkIdentity() {
    auto const name = [this] { return named(identity_.kindName, path_); };
    Header header = readHeader(handle_.get());
    bool const maybeOurs = header.kind == Header::Kind::Zeros ||
                           (header.kind == Header::Kind::Database && header.applicationId == identity_.applicationId);
    // Asked after the header was read: a journal that is gone by now had committed what the header says.
    char const *const journal = sqlite3_filename_journal(sqlite3_db_filename(handle_.get(), "main"));
    if (maybeOurs && exists(journal)) {
        // Any read rolls back what a killed process left, which may be all there is: its first transaction.
        Query(*this, "SELECT count(*) FROM sqlite_schema").step();
        header = readHeader(handle_.get());
    }
    if (header.kind == Header::Kind::Empty) {
        if (mode_ != Mode::Create) {
            throw Error(ErrorKind::Missing, name() + " has no content yet");
        }
        createLayout();
        header = readHeader(handle_.get());
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
    if (identity_.isFromOthers) {
        checkLayout();
    }
}

void Database::checkLayout() {
    // SQLite keeps each statement as it was written, from its first word to before its semicolon.
    std::string_view const schema = identity_.schema;
    std::size_t missing = 0;
    for (std::size_t at = schema.find("CREATE "); at != std::string_view::npos; at = schema.find("CREATE ", at + 1)) {
        ++missing;
    }
    Query made(*this, "SELECT sql FROM sqlite_schema WHERE sql IS NOT NULL");
    while (made.step()) {
        std::string const statement = made.text(0);
        if (!statement.starts_with("CREATE ") || schema.find(statement + ";") == std::string_view::npos) {
            throw Error(ErrorKind::Malformed, named(identity_.kindName, path_) +
                                                  " is damaged: it holds something that does not belong there");
        }
        --missing; // one of them each time: SQLite itself refuses a file that makes something twice
    }
    if (missing != 0) {
        throw Error(ErrorKind::Malformed,
                    named(identity_.kindName, path_) + " is damaged: a part of its layout is gone");
    }
}

void Database::createLayout() {
    execute("PRAGMA journal_mode=DELETE; PRAGMA synchronous=EXTRA");
    Transaction transaction(*this);
    // Two processes may have found the file empty; the second one finds the layout made.
    Query tables(*this, "SELECT count(*) FROM sqlite_schema");
    tables.step();
    if (tables.integer(0) != 0) {
        return;
    }
    tables.reset();
    execute("PRAGMA application_id=" + std::to_string(identity_.applicationId));
    execute("PRAGMA user_version=" + std::to_string(identity_.userVersion));
    execute(identity_.schema);
    transaction.commit();
}

void Database::configure(Options const &options) {
    // What needs no statement is set without one: each costs every command some thousand instructions.
    check(sqlite3_db_config(handle_.get(), SQLITE_DBCONFIG_ENABLE_FKEY, 1, nullptr));
    check(sqlite3_db_config(handle_.get(), SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0, nullptr));
    execute("PRAGMA journal_mode=DELETE;"
            "PRAGMA synchronous=EXTRA;"
            "PRAGMA temp_store=MEMORY;"
            "PRAGMA cell_size_check=ON");
    if (options.cacheKib) {
        execute("PRAGMA cache_size=-" + std::to_string(*options.cacheKib));
    }
    if (mode_ == Mode::QueryOnly) {
        execute("PRAGMA query_only=ON");
    }
}

Query Database::query(std::string_view sql) {
    return Query(*this, sql);
}

void Database::execute(std::string const &sql) {
    check(sqlite3_exec(handle_.get(), sql.c_str(), nullptr, nullptr, nullptr));
}

int64_t Database::lastInsertId() const {
    return sqlite3_last_insert_rowid(handle_.get());
}

int64_t Database::changes() const {
    return sqlite3_changes(handle_.get());
}

int64_t Database::dataVersion() {
    Query version(*this, "PRAGMA data_version");
    version.step();
    return version.integer(0);
}

bool Database::hasMoved() const {
    int moved = 0;
    sqlite3_file_control(handle_.get(), "main", SQLITE_FCNTL_HAS_MOVED, &moved);
    return moved != 0;
}

void Database::checkIntegrity() {
    Query check(*this, "PRAGMA quick_check(1)");
    check.step(); // at least one row, always
    if (check.textView(0) != "ok") {
        throw Error(ErrorKind::Malformed, named(identity_.kindName, path_) + " is damaged: " + check.text(0));
    }
}

Statement Database::take(std::string_view sql) {
    if (auto const found = idle_.find(sql); found != idle_.end() && !found->second.empty()) {
        Statement statement = std::move(found->second.back());
        found->second.pop_back();
        return statement;
    }
    sqlite3_stmt *prepared = nullptr;
    check(sqlite3_prepare_v2(handle_.get(), sql.data(), static_cast<int>(sql.size()), &prepared, nullptr));
    return Statement(prepared);
}

void Database::giveBack(Statement statement) noexcept {
    sqlite3_reset(statement.get());
    sqlite3_clear_bindings(statement.get());
    try {
        idle_[sqlite3_sql(statement.get())].push_back(std::move(statement));
    } catch (std::bad_alloc const &) {
        // Not kept, then: it is prepared again next time.
    }
}

void Database::check(int code) const {
    if (code != SQLITE_OK) {
        fail();
    }
}

void Database::fail() const {
    int const code = sqlite3_extended_errcode(handle_.get());
    int const systemError = sqlite3_system_errno(handle_.get());
    char const *const text = sqlite3_errmsg(handle_.get());
    std::string const name = named(identity_.kindName, path_);
    if (code == SQLITE_CANTOPEN && whyNotOpen(path_) == 0) {
        // The file is open; it is its journal that cannot be. SQLite has tried to read one then, so that its error says
        // that there is none.
        if (!mayMakeFileBeside(path_)) {
            throw explain(SQLITE_READONLY, systemError, text, name, busyTimeout_);
        }
        throw Error(ErrorKind::Io, name + " cannot be written: its journal cannot be made");
    }
    throw explain(code, systemError, text, name, busyTimeout_);
}

} // namespace Sqlite
