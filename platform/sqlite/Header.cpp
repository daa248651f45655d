// SPDX-License-Identifier: Apache-2.0
#include "Header.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>

#include <sqlite3.h>

namespace Sqlite {
namespace {

constexpr std::size_t headerSize = 100;
constexpr std::size_t userVersionOffset = 60;
constexpr std::size_t applicationIdOffset = 68;
constexpr std::string_view magic{"SQLite format 3\0", 16};

using Bytes = std::array<unsigned char, headerSize>;

int32_t bigEndian(Bytes const &bytes, std::size_t offset) {
    uint32_t value = 0;
    for (std::size_t i = 0; i < 4; ++i) {
        value = (value << 8) | bytes.at(offset + i);
    }
    return static_cast<int32_t>(value);
}

} // namespace

Header readHeader(sqlite3 *handle) {
    Header header;
    sqlite3_file *file = nullptr;
    if (sqlite3_file_control(handle, "main", SQLITE_FCNTL_FILE_POINTER, &file) != SQLITE_OK || file == nullptr ||
        file->pMethods == nullptr) {
        return header;
    }
    sqlite3_int64 size = 0;
    if (file->pMethods->xFileSize(file, &size) != SQLITE_OK) {
        return header;
    }
    Bytes bytes{};
    if (size == 0) {
        // SQLite calls a file of one byte empty, too; that byte is somebody's.
        bool const oneByte = file->pMethods->xRead(file, bytes.data(), 1, 0) == SQLITE_OK;
        header.kind = oneByte ? Header::Kind::Garbage : Header::Kind::Empty;
        return header;
    }
    if (file->pMethods->xRead(file, bytes.data(), static_cast<int>(bytes.size()), 0) != SQLITE_OK) {
        return header;
    }
    if (std::memcmp(bytes.data(), magic.data(), magic.size()) == 0) {
        header.kind = Header::Kind::Database;
        header.applicationId = bigEndian(bytes, applicationIdOffset);
        header.userVersion = bigEndian(bytes, userVersionOffset);
    } else if (std::all_of(bytes.begin(), bytes.end(), [](unsigned char byte) { return byte == 0; })) {
        header.kind = Header::Kind::Zeros;
    }
    return header;
}

} // namespace Sqlite
