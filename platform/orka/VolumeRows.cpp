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

void failDamaged(Sqlite::Database const &database, std::string const &what) {
    throw Wire::Failure(Wire::ErrorCode::FileMalformed, "the array file '" + database.path() + "' is damaged: " + what);
}

void requireId(Sqlite::Database const &database, std::string const &id, char const *whose) {
    if (Wire::normalizeContainerId(id) != id) {
        failDamaged(database, std::string(whose) + " has an id that is none");
    }
}

ContainerRow requireContainer(Sqlite::Database &database, std::string const &containerId) {
    auto row = database.query("SELECT seq, max_lumo_size_mb FROM container WHERE id = ?");
    row.bind(1, Wire::normalizeContainerId(containerId).value_or(containerId));
    if (!row.step()) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchContainer, "there is no storage container " + containerId);
    }
    ContainerRow const container{row.integer(0), row.integer(1)};
    if (container.maxLumoSizeMb <= 0) {
        failDamaged(database, "the storage container " + containerId + " has no size");
    }
    return container;
}

VirtualVolume volumeOf(Sqlite::Database const &database, Sqlite::Query const &row) {
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
    requireId(database, volume.uuid, "a virtual volume");
    requireId(database, volume.containerId, "a storage container");
    if (volume.kind != VolumeKind::Config && volume.kind != VolumeKind::Data) {
        failDamaged(database, "the virtual volume " + volume.uuid + " is of no kind");
    }
    bool const isSized = volume.sizeMb > 0 && volume.committedMb >= 0 && volume.committedMb <= volume.sizeMb;
    int64_t const unsharedMb = volume.unsharedMb.value_or(0);
    if (!isSized || unsharedMb < 0 || unsharedMb > volume.committedMb || volume.blockSize <= 0) {
        failDamaged(database, "the virtual volume " + volume.uuid + " has sizes that cannot be");
    }
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
    return {row.integer(0), volumeOf(database, row)};
}

} // namespace Orka
