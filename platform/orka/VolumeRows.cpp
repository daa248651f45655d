// SPDX-License-Identifier: Apache-2.0
#include "VolumeRows.h"

#include "wire/ContainerId.h"
#include "wire/Failure.h"

namespace Orka {

std::optional<std::string> optionalText(Sqlite::Query const &row, int column) {
    if (row.isNull(column)) {
        return std::nullopt;
    }
    return row.text(column);
}

std::optional<int64_t> optionalInteger(Sqlite::Query const &row, int column) {
    if (row.isNull(column)) {
        return std::nullopt;
    }
    return row.integer(column);
}

ContainerRow requireContainer(Sqlite::Database &database, std::string const &containerId) {
    auto row = database.query("SELECT seq, max_lumo_size_mb FROM container WHERE id = ?");
    row.bind(1, Wire::normalizeContainerId(containerId).value_or(containerId));
    if (!row.step()) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchContainer, "there is no storage container " + containerId);
    }
    return {row.integer(0), row.integer(1)};
}

VirtualVolume volumeOf(Sqlite::Query const &row) {
    VirtualVolume volume;
    volume.uuid = row.text(1);
    volume.containerId = row.text(2);
    volume.kind = static_cast<VolumeKind>(row.integer(3));
    volume.directoryName = row.text(4);
    volume.sizeMb = row.integer(5);
    volume.committedMb = row.integer(6);
    volume.unsharedMb = optionalInteger(row, 7);
    volume.profile = optionalText(row, 8);
    volume.blockSize = row.integer(9);
    volume.vmUuid = row.text(10);
    volume.boundTo = optionalText(row, 11);
    return volume;
}

VolumeRow requireVolume(Sqlite::Database &database, std::string const &containerId, std::string const &uuid) {
    auto const container = requireContainer(database, containerId);
    auto row = database.query(std::string(selectVolumes) + "WHERE v.uuid = ? AND v.container = ?");
    row.bind(1, Wire::normalizeContainerId(uuid).value_or(uuid)).bind(2, container.seq);
    if (!row.step()) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchVolume,
                            "there is no virtual volume " + uuid + " in the storage container " + containerId);
    }
    return {row.integer(0), volumeOf(row)};
}

} // namespace Orka
