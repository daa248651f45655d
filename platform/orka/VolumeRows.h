// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "orka/Model.h"
#include "sqlite/Database.h"

namespace Orka {

/// The key under which a new config volume's directory name becomes its first metadata pair.
inline constexpr char const *directoryNameKey = "directoryName";

/// A container's row. @throws Wire::Failure NoSuchContainer
struct ContainerRow {
    int64_t seq = 0;
    int64_t maxLumoSizeMb = 0;
};
ContainerRow requireContainer(Sqlite::Database &database, std::string const &containerId);

/// A volume and the number of its row.
struct VolumeRow {
    int64_t seq = 0;
    VirtualVolume volume;
};

/// The volume with an id, in any accepted spelling. @throws Wire::Failure NoSuchContainer, NoSuchVolume
VolumeRow requireVolume(Sqlite::Database &database, std::string const &containerId, std::string const &uuid);

/// An array file may be anybody's, and a row breaks the layout's rules when they were off as it was written.
/// @throws Wire::Failure FileMalformed, with the path and what is wrong
[[noreturn]] void failDamaged(Sqlite::Database const &database, std::string const &what);
/// @throws Wire::Failure FileMalformed for an id that is not canonical; `whose` says whose it is
void requireId(Sqlite::Database const &database, std::string const &id, char const *whose);

/// Asks for volumes as volumeOf() reads them, the number of the row in column 0; conditions follow.
inline constexpr char const *selectVolumes =
    "SELECT v.seq, v.uuid, c.id, v.kind, coalesce(v.directory_name, ''), v.size_mb, v.committed_mb, v.unshared_mb, "
    "v.profile, v.block_size, v.vm_uuid, e.uid "
    "FROM volume v CROSS JOIN container c ON c.seq = v.container LEFT JOIN endpoint e ON e.seq = v.bound_to ";
/// @throws Wire::Failure FileMalformed for one that no array has
VirtualVolume volumeOf(Sqlite::Database const &database, Sqlite::Query const &row);

/// A nullable column.
std::optional<std::string> optionalText(Sqlite::Query const &row, int column);
std::optional<int64_t> optionalInteger(Sqlite::Query const &row, int column);

} // namespace Orka
