// SPDX-License-Identifier: Apache-2.0
#include "Schema.h"

namespace Store {
namespace {

// Rows are handed out in the order of their integer keys, which is the order of addition.
constexpr char const *layout = R"sql(
CREATE TABLE provider (
    id INTEGER PRIMARY KEY,
    name TEXT NOT NULL UNIQUE,
    url TEXT NOT NULL,
    aux_text TEXT NOT NULL
) STRICT;

CREATE TABLE provider_array (
    provider INTEGER NOT NULL REFERENCES provider(id) ON DELETE CASCADE,
    position INTEGER NOT NULL,
    array_id TEXT NOT NULL,
    is_active INTEGER NOT NULL CHECK (is_active IN (0, 1)),
    priority INTEGER NOT NULL,
    PRIMARY KEY (provider, position)
) STRICT, WITHOUT ROWID;

CREATE TABLE file_system (
    id INTEGER PRIMARY KEY,
    name TEXT NOT NULL UNIQUE,
    container_id TEXT NOT NULL UNIQUE
) STRICT;

CREATE TABLE file_system_array (
    file_system INTEGER NOT NULL REFERENCES file_system(id) ON DELETE CASCADE,
    position INTEGER NOT NULL,
    array_id TEXT NOT NULL,
    PRIMARY KEY (file_system, position)
) STRICT, WITHOUT ROWID;

-- state: 0 mounted, 1 unmounted, 2 mounting, 3 unmounting, 4 removing
CREATE TABLE volume (
    id INTEGER PRIMARY KEY,
    uuid TEXT NOT NULL UNIQUE,
    file_system INTEGER NOT NULL REFERENCES file_system(id) ON DELETE CASCADE,
    directory_name TEXT NOT NULL,
    state INTEGER NOT NULL CHECK (state BETWEEN 0 AND 4)
) STRICT;
-- That a name is mounted once a container is checked by the writer: a unique index over the mounted ones would have to be
-- written at each mount and unmount.
CREATE INDEX volume_name ON volume(file_system, directory_name);
CREATE INDEX volume_unsettled ON volume(id) WHERE state IN (2, 3, 4);

CREATE TABLE endpoint_outage (
    uid TEXT NOT NULL PRIMARY KEY
) STRICT, WITHOUT ROWID;

CREATE TABLE setting (
    name TEXT NOT NULL PRIMARY KEY,
    value TEXT NOT NULL
) STRICT, WITHOUT ROWID;
)sql";

} // namespace

Sqlite::Identity const &identity() {
    static Sqlite::Identity const value{0x54764873, 1, layout, "the host store"};
    return value;
}

} // namespace Store
