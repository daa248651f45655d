// SPDX-License-Identifier: Apache-2.0
#include "DatabaseInput.h"

#include <algorithm>
#include <array>
#include <memory>
#include <stdexcept>

#include <sqlite3.h>

#include "Scratch.h"

namespace Fuzz {

namespace {

constexpr std::string_view magic{"SQLite format 3\0", 16};
/// Steps of SQLite's machine, in thousands, that one input may take.
constexpr int thousandsMax = 200;

using Handle = std::unique_ptr<sqlite3, decltype(&sqlite3_close)>;

Handle opened(std::string const &path) {
    sqlite3 *handle = nullptr;
    int const result = sqlite3_open_v2(path.c_str(), &handle, SQLITE_OPEN_READWRITE, nullptr);
    Handle owned(handle, &sqlite3_close);
    if (result != SQLITE_OK) {
        throw std::runtime_error(path + " cannot be opened");
    }
    return owned;
}

/// Other files are not the input's to touch; of pragmas it may use those that make a bad file.
int authorize(void *, int action, char const *first, char const *, char const *, char const *) {
    if (action == SQLITE_ATTACH || action == SQLITE_DETACH) {
        return SQLITE_DENY;
    }
    constexpr std::array<std::string_view, 6> pragmas{"writable_schema", "ignore_check_constraints",
                                                      "user_version",    "application_id",
                                                      "foreign_keys",    "legacy_alter_table"};
    bool const isForbidden =
        action == SQLITE_PRAGMA && std::find(pragmas.begin(), pragmas.end(), std::string_view(first)) == pragmas.end();
    return isForbidden ? SQLITE_DENY : SQLITE_OK;
}

void run(sqlite3 *handle, std::string const &statements) {
    int left = thousandsMax;
    sqlite3_progress_handler(
        handle, 1000, [](void *count) { return --*static_cast<int *>(count) < 0 ? 1 : 0; }, &left);
    sqlite3_set_authorizer(handle, authorize, nullptr);
    sqlite3_limit(handle, SQLITE_LIMIT_LENGTH, 1 << 20);
    // Statement by statement: one that fails does not keep the others from running.
    char const *rest = statements.c_str();
    while (*rest != '\0' && left > 0) {
        sqlite3_stmt *statement = nullptr;
        char const *const begin = rest;
        int const result = sqlite3_prepare_v2(handle, begin, -1, &statement, &rest);
        if (result == SQLITE_OK && statement != nullptr) {
            while (sqlite3_step(statement) == SQLITE_ROW) {
            }
        }
        sqlite3_finalize(statement);
        if (rest == begin) {
            break; // what SQLite does not even see the end of
        }
    }
    if (sqlite3_get_autocommit(handle) == 0) {
        sqlite3_exec(handle, "COMMIT", nullptr, nullptr, nullptr);
    }
}

} // namespace

void putDatabase(std::string const &path, std::string_view sound, std::string_view input) {
    removeFile(path + "-journal");
    if (input.starts_with(magic)) {
        writeFile(path, input);
        return;
    }
    writeFile(path, sound);
    Handle const handle = opened(path);
    sqlite3_exec(handle.get(), "PRAGMA journal_mode=MEMORY; PRAGMA synchronous=OFF", nullptr, nullptr, nullptr);
    run(handle.get(), std::string(input));
}

std::string smallest(std::string const &path) {
    {
        Handle const handle = opened(path);
        char const *const statements = "PRAGMA journal_mode=MEMORY; PRAGMA page_size=512; VACUUM";
        if (sqlite3_exec(handle.get(), statements, nullptr, nullptr, nullptr) != SQLITE_OK) {
            throw std::runtime_error(path + ": " + sqlite3_errmsg(handle.get()));
        }
    }
    return readFile(path);
}

} // namespace Fuzz
