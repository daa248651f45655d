// SPDX-License-Identifier: Apache-2.0
//
// The floor of a load that finds everything mounted: the bytes of the daemon's answer, looked at by nobody, and name
// and id of every mounted container, read from the store's file and kept by nobody.
//
//   bench_mounted RECORDING DATABASE
//
// The recording is one of bench_record's, for the daemon of TOVI_ROOT; the database is a copy of the host store.
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>

#include <sqlite3.h>

#include "Recording.h"

namespace {

void require(sqlite3 *database, bool holds) {
    if (!holds) {
        throw std::runtime_error(sqlite3_errmsg(database));
    }
}

/// @return the bytes of all names and ids
size_t readMounted(sqlite3 *database) {
    sqlite3_stmt *row = nullptr;
    char const *const query = "SELECT name, container_id FROM file_system ORDER BY id";
    require(database, sqlite3_prepare_v2(database, query, -1, &row, nullptr) == SQLITE_OK);
    size_t bytes = 0;
    int code = sqlite3_step(row);
    for (; code == SQLITE_ROW; code = sqlite3_step(row)) {
        for (int const column : {0, 1}) {
            require(database, sqlite3_column_text(row, column) != nullptr);
            bytes += static_cast<size_t>(sqlite3_column_bytes(row, column));
        }
    }
    require(database, code == SQLITE_DONE);
    sqlite3_finalize(row);
    return bytes;
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    if (argc != 3 || root == nullptr) {
        std::fputs("usage: TOVI_ROOT=DIR bench_mounted RECORDING DATABASE\n", stderr);
        return 2;
    }
    sqlite3 *database = nullptr;
    try {
        Bench::replayRecording(std::string(root) + "/run/lumod.sock", argv[1]);
        require(database,
                sqlite3_open_v2(argv[2], &database, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr) == SQLITE_OK);
        if (readMounted(database) == 0) {
            throw std::runtime_error("no container is mounted");
        }
        require(database, sqlite3_close(database) == SQLITE_OK);
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_mounted: %s\n", error.what());
        return 1;
    }
    return 0;
}
