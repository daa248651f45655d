// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>

#include "sqlite/Error.h"

namespace Sqlite {

/// How long a row, and so a text, of a file from others may be: twice a request to the daemon, so that what a request
/// has written can be read.
inline constexpr int rowBytesMax = 2 << 20;

/// "the host store '/srv/host.db'": how every sentence begins.
std::string named(std::string const &kindName, std::string const &path);

/// Turns a result code of SQLite into an Error with a finished sentence. Memory that ran out is thrown as
/// std::bad_alloc.
/// @param code        the extended result code
/// @param systemError errno behind it, 0 when unknown
/// @param detail      SQLite's own words, used where ours say less
Error explain(int code, int systemError, char const *detail, std::string const &name,
              std::chrono::milliseconds busyTimeout);

} // namespace Sqlite
