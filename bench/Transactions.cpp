// SPDX-License-Identifier: Apache-2.0
//
// The floor of every command that changes the host: a bare program that opens a database file as the host store is
// opened and commits as many durable transactions.
//
//   bench_transactions FILE COUNT STATEMENTS [DIRECTORY]
//   bench_transactions FILE COUNT STATEMENTS RECORDING SOCKET FROM TO
//
// STATEMENTS change rows; in each ?1 is bound to "bench-<n>" and ?2 to a container id made of n. With a DIRECTORY each
// transaction begins with a new directory "bench-<n>" in it, as a host has one for each container. With a RECORDING of
// bench_record's the program first sends its requests to the daemon behind the SOCKET, and at last renames FROM to TO:
// the round trip and the rename of a mount.
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <sys/stat.h>
#include <vector>

#include <sqlite3.h>

#include "Recording.h"

namespace {

void check(sqlite3 *database, int code) {
    if (code != SQLITE_OK && code != SQLITE_DONE && code != SQLITE_ROW) {
        throw std::runtime_error(sqlite3_errmsg(database));
    }
}

void execute(sqlite3 *database, char const *statements) {
    check(database, sqlite3_exec(database, statements, nullptr, nullptr, nullptr));
}

std::vector<sqlite3_stmt *> prepared(sqlite3 *database, char const *statements) {
    std::vector<sqlite3_stmt *> all;
    while (*statements != '\0') {
        sqlite3_stmt *statement = nullptr;
        check(database, sqlite3_prepare_v2(database, statements, -1, &statement, &statements));
        all.push_back(statement);
    }
    return all;
}

void commitEach(sqlite3 *database, int count, char const *statements, char const *directory) {
    std::vector<sqlite3_stmt *> const changes = prepared(database, statements);
    for (int n = 0; n < count; ++n) {
        std::string const name = "bench-" + std::to_string(n);
        char id[37];
        std::snprintf(id, sizeof(id), "be4c0000-0000-4000-8000-%012d", n);
        if (directory != nullptr && mkdir((directory + ("/" + name)).c_str(), 0755) != 0) {
            throw std::runtime_error(name + " cannot be made");
        }
        execute(database, "BEGIN IMMEDIATE");
        for (sqlite3_stmt *const statement : changes) {
            check(database, sqlite3_bind_text(statement, 1, name.c_str(), -1, SQLITE_TRANSIENT));
            if (sqlite3_bind_parameter_count(statement) > 1) {
                check(database, sqlite3_bind_text(statement, 2, id, -1, SQLITE_TRANSIENT));
            }
            check(database, sqlite3_step(statement));
            check(database, sqlite3_reset(statement));
        }
        execute(database, "COMMIT");
    }
    for (sqlite3_stmt *const statement : changes) {
        sqlite3_finalize(statement);
    }
}

} // namespace

int main(int argc, char **argv) {
    int const count = argc == 4 || argc == 5 || argc == 8 ? std::atoi(argv[2]) : 0;
    if (count < 1) {
        std::fputs("usage: bench_transactions FILE COUNT STATEMENTS [DIRECTORY | RECORDING SOCKET FROM TO]\n", stderr);
        return 2;
    }
    sqlite3 *database = nullptr;
    try {
        if (argc == 8) {
            Bench::replayRecording(argv[5], argv[4]);
        }
        check(database, sqlite3_open_v2(argv[1], &database, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr));
        execute(database, "PRAGMA journal_mode=DELETE; PRAGMA synchronous=EXTRA; PRAGMA foreign_keys=ON");
        commitEach(database, count, argv[3], argc == 5 ? argv[4] : nullptr);
        check(database, sqlite3_close(database));
        if (argc == 8 && std::rename(argv[6], argv[7]) != 0) {
            throw std::runtime_error(std::string(argv[6]) + " cannot be renamed");
        }
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_transactions: %s\n", error.what());
        return 1;
    }
    return 0;
}
