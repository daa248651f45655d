// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

struct sqlite3;

namespace Sqlite {

/// What the first bytes of a database file say, read without a lock and without rolling anything back.
struct Header {
    enum class Kind {
        Empty,    ///< no bytes at all
        Database, ///< the other fields count
        Zeros,    ///< nothing but zeros where the header belongs: cut off in its very first transaction, or no database
        Garbage,  ///< no database
    };
    Kind kind = Kind::Garbage;
    int32_t applicationId = 0;
    int32_t userVersion = 0;
};

/// Reads through the connection's own descriptor: opening the file a second time and closing it would drop every lock
/// that this process holds on it.
/// @return Garbage also when the file cannot be read
Header readHeader(sqlite3 *handle);

} // namespace Sqlite
