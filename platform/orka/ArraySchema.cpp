// SPDX-License-Identifier: Apache-2.0
#include "ArraySchema.h"

namespace Orka {

namespace {

// The order of rows (seq) is the order in which things were told or made, and the order in which they are shown.
constexpr char const *schema = R"sql(
CREATE TABLE storage_array (
    seq INTEGER PRIMARY KEY,
    id TEXT NOT NULL UNIQUE CHECK (id <> ''),
    name TEXT NOT NULL,
    vendor_id TEXT NOT NULL,
    model_id TEXT NOT NULL
) STRICT;

-- A text that the array does not tell is NULL.
CREATE TABLE endpoint (
    seq INTEGER PRIMARY KEY,
    array INTEGER NOT NULL REFERENCES storage_array (seq),
    uid TEXT UNIQUE CHECK (uid <> ''),
    type INTEGER NOT NULL,
    text1 TEXT,
    text2 TEXT,
    accessible INTEGER NOT NULL CHECK (accessible IN (0, 1)),
    configured INTEGER NOT NULL CHECK (configured IN (0, 1))
) STRICT;
CREATE INDEX endpoint_of_array ON endpoint (array, seq);

CREATE TABLE endpoint_address (
    endpoint INTEGER NOT NULL REFERENCES endpoint (seq),
    position INTEGER NOT NULL,
    address TEXT NOT NULL,
    PRIMARY KEY (endpoint, position)
) STRICT, WITHOUT ROWID;

CREATE TABLE container (
    seq INTEGER PRIMARY KEY,
    id TEXT NOT NULL UNIQUE CHECK (length(id) = 36),
    name TEXT NOT NULL,
    max_lumo_size_mb INTEGER NOT NULL CHECK (max_lumo_size_mb > 0)
) STRICT;

CREATE TABLE container_array (
    container INTEGER NOT NULL REFERENCES container (seq),
    position INTEGER NOT NULL,
    array INTEGER NOT NULL REFERENCES storage_array (seq),
    PRIMARY KEY (container, position),
    UNIQUE (container, array)
) STRICT, WITHOUT ROWID;

-- unshared_mb is NULL when the array cannot tell what is shared.
CREATE TABLE volume (
    seq INTEGER PRIMARY KEY,
    uuid TEXT NOT NULL UNIQUE CHECK (length(uuid) = 36),
    container INTEGER NOT NULL REFERENCES container (seq),
    kind INTEGER NOT NULL CHECK (kind IN (0, 1)),
    directory_name TEXT CHECK (directory_name <> ''),
    size_mb INTEGER NOT NULL CHECK (size_mb > 0),
    committed_mb INTEGER NOT NULL CHECK (committed_mb BETWEEN 0 AND size_mb),
    unshared_mb INTEGER CHECK (unshared_mb BETWEEN 0 AND committed_mb),
    profile TEXT,
    block_size INTEGER NOT NULL CHECK (block_size > 0),
    vm_uuid TEXT NOT NULL,
    bound_to INTEGER REFERENCES endpoint (seq),
    CHECK ((kind = 0) = (directory_name IS NOT NULL))
) STRICT;
CREATE UNIQUE INDEX volume_directory ON volume (container, directory_name) WHERE directory_name IS NOT NULL;
CREATE INDEX volume_of_container ON volume (container, kind, seq);
CREATE INDEX volume_bound ON volume (bound_to) WHERE bound_to IS NOT NULL;

CREATE TABLE metadata (
    volume INTEGER NOT NULL REFERENCES volume (seq) ON DELETE CASCADE,
    position INTEGER NOT NULL,
    key TEXT NOT NULL,
    value TEXT NOT NULL,
    PRIMARY KEY (volume, position)
) STRICT, WITHOUT ROWID;

-- What was answered to a mutation that carried an idempotency key; the last three columns only for a volume's making.
CREATE TABLE answer (
    seq INTEGER PRIMARY KEY,
    idempotency_key TEXT NOT NULL UNIQUE,
    request TEXT NOT NULL,
    uuid TEXT,
    size_mb INTEGER,
    block_size INTEGER
) STRICT;

CREATE TABLE host_context (
    only_row INTEGER PRIMARY KEY CHECK (only_row = 1),
    context TEXT
) STRICT;
INSERT INTO host_context VALUES (1, NULL);
)sql";

} // namespace

Sqlite::Identity const &arrayFileIdentity() {
    // "TvAr"
    static Sqlite::Identity const identity{0x54764172, 1, schema, "the array file", true};
    return identity;
}

} // namespace Orka
