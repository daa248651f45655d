// SPDX-License-Identifier: Apache-2.0
//
// What may be done to volumes. Every mutation has one shape: a transaction in which the key is looked up first, then
// the rules are checked, then rows change, and the answer is kept beside them; one commit makes all of it durable.
#include <algorithm>

#include "Answers.h"
#include "FileFailure.h"
#include "VolumeRows.h"
#include "orka/ArrayFile.h"
#include "sqlite/Transaction.h"
#include "wire/ContainerId.h"
#include "wire/Failure.h"

namespace Orka {

namespace {

constexpr int64_t defaultSizeMb = 4096;
constexpr int64_t newVolumeBlockSize = int64_t{1} << 20;

Wire::Failure invalid(std::string sentence) {
    return {Wire::ErrorCode::InvalidArgument, std::move(sentence)};
}

void checkSpec(VolumeSpec const &spec) {
    if (spec.kind != VolumeKind::Config && spec.kind != VolumeKind::Data) {
        throw invalid("there is no kind " + std::to_string(static_cast<int32_t>(spec.kind)) + " of virtual volume");
    }
    if (spec.kind == VolumeKind::Config && spec.directoryName.empty()) {
        throw invalid("a config volume needs a directory name");
    }
    if (spec.kind == VolumeKind::Data && !spec.directoryName.empty()) {
        throw invalid("a data volume has no directory name, but '" + spec.directoryName + "' was given");
    }
    for (auto const *text : {&spec.directoryName, &spec.vmUuid}) {
        if (text->find('\0') != std::string::npos) {
            throw invalid("a virtual volume's texts cannot hold the character NUL");
        }
    }
    if (spec.profile && spec.profile->find('\0') != std::string::npos) {
        throw invalid("a virtual volume's texts cannot hold the character NUL");
    }
}

int64_t resolveSize(VolumeSpec const &spec, ContainerRow const &container) {
    if (spec.sizeMb < 0) {
        throw invalid("a virtual volume cannot have a size of " + std::to_string(spec.sizeMb) + " MB");
    }
    if (spec.sizeMb > container.maxLumoSizeMb) {
        throw Wire::Failure(Wire::ErrorCode::TooLarge, "a virtual volume of " + std::to_string(spec.sizeMb) +
                                                           " MB is larger than the storage container " +
                                                           spec.containerId + " allows (" +
                                                           std::to_string(container.maxLumoSizeMb) + " MB)");
    }
    return spec.sizeMb == 0 ? std::min(defaultSizeMb, container.maxLumoSizeMb) : spec.sizeMb;
}

void checkDirectoryNameIsFree(Sqlite::Database &database, VolumeSpec const &spec, ContainerRow const &container) {
    auto row = database.query("SELECT 1 FROM volume WHERE container = ? AND directory_name = ?");
    row.bind(1, container.seq).bind(2, spec.directoryName);
    if (row.step()) {
        throw Wire::Failure(Wire::ErrorCode::AlreadyExists, "the storage container " + spec.containerId +
                                                                " has a config volume '" + spec.directoryName +
                                                                "' already");
    }
}

void insertVolume(Sqlite::Database &database, VolumeSpec const &spec, ContainerRow const &container,
                  CreatedVolume const &created) {
    auto insert = database.query(
        "INSERT INTO volume (uuid, container, kind, directory_name, size_mb, committed_mb, unshared_mb, profile, "
        "block_size, vm_uuid) VALUES (?, ?, ?, ?, ?, 0, 0, ?, ?, ?)");
    insert.bind(1, created.uuid)
        .bind(2, container.seq)
        .bind(3, int64_t{static_cast<int32_t>(spec.kind)})
        .bind(5, created.sizeMb)
        .bind(7, created.blockSize)
        .bind(8, spec.vmUuid);
    if (spec.kind == VolumeKind::Config) {
        insert.bind(4, spec.directoryName);
    }
    if (spec.profile) {
        insert.bind(6, *spec.profile);
    }
    insert.run();
    if (spec.kind == VolumeKind::Config) {
        auto pair = database.query("INSERT INTO metadata (volume, position, key, value) VALUES (?, 0, ?, ?)");
        pair.bind(1, database.lastInsertId()).bind(2, directoryNameKey).bind(3, spec.directoryName).run();
    }
}

/// The volume as it was when it was made, whatever became of it since.
VirtualVolume volumeAsCreated(VolumeSpec const &spec, CreatedVolume const &created) {
    VirtualVolume volume;
    volume.uuid = created.uuid;
    volume.containerId = Wire::normalizeContainerId(spec.containerId).value_or(spec.containerId);
    volume.kind = spec.kind;
    volume.directoryName = spec.directoryName;
    volume.sizeMb = created.sizeMb;
    volume.committedMb = 0;
    volume.unsharedMb = 0;
    volume.profile = spec.profile;
    volume.blockSize = created.blockSize;
    volume.vmUuid = spec.vmUuid;
    return volume;
}

struct EndpointRow {
    int64_t seq = 0;
    bool isAccessible = false;
};

EndpointRow requireEndpoint(Sqlite::Database &database, VolumeRow const &volume, std::string const &uid) {
    auto row = database.query("SELECT e.seq, e.accessible FROM endpoint e WHERE e.uid = ?1 AND e.array IN "
                              "(SELECT array FROM container_array WHERE container = "
                              "(SELECT container FROM volume WHERE seq = ?2))");
    row.bind(1, uid).bind(2, volume.seq);
    if (!row.step()) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchEndpoint, "no storage array of the storage container " +
                                                                 volume.volume.containerId +
                                                                 " has a protocol endpoint " + uid);
    }
    return {row.integer(0), row.integer(1) != 0};
}

} // namespace

VirtualVolume ArrayFile::createVolume(std::string const &idempotencyKey, VolumeSpec const &spec) {
    return onFile([&] {
        checkSpec(spec);
        auto const request =
            requestText("createVirtualVolume", {spec.containerId, std::to_string(static_cast<int32_t>(spec.kind)),
                                                spec.directoryName, std::to_string(spec.sizeMb),
                                                spec.profile ? "profile" : "", spec.profile.value_or(""), spec.vmUuid});
        Sqlite::Transaction transaction(*database_);
        if (auto const before = recall(*database_, idempotencyKey, request)) {
            if (!before->created) {
                failDamaged(*database_, "the answer to an earlier request names no virtual volume");
            }
            return volumeAsCreated(spec, *before->created);
        }
        auto const container = requireContainer(*database_, spec.containerId);
        CreatedVolume created{newUuid_(), resolveSize(spec, container), newVolumeBlockSize};
        checkDirectoryNameIsFree(*database_, spec, container);
        insertVolume(*database_, spec, container, created);
        remember(*database_, idempotencyKey, request, created);
        transaction.commit();
        return volumeAsCreated(spec, created);
    });
}

void ArrayFile::deleteVolume(std::string const &idempotencyKey, std::string const &containerId,
                             std::string const &uuid) {
    onFile([&] {
        auto const request = requestText("deleteVirtualVolume", {containerId, uuid});
        Sqlite::Transaction transaction(*database_);
        if (recall(*database_, idempotencyKey, request)) {
            return;
        }
        auto const row = requireVolume(*database_, containerId, uuid);
        if (row.volume.boundTo) {
            throw Wire::Failure(Wire::ErrorCode::InUse, "the virtual volume " + row.volume.uuid +
                                                            " is bound to the protocol endpoint " +
                                                            *row.volume.boundTo);
        }
        database_->query("DELETE FROM volume WHERE seq = ?").bind(1, row.seq).run();
        remember(*database_, idempotencyKey, request, std::nullopt);
        transaction.commit();
    });
}

void ArrayFile::bindVolume(std::string const &idempotencyKey, std::string const &containerId, std::string const &uuid,
                           std::string const &endpointUid) {
    onFile([&] {
        auto const request = requestText("bindVirtualVolume", {containerId, uuid, endpointUid});
        Sqlite::Transaction transaction(*database_);
        if (recall(*database_, idempotencyKey, request)) {
            return;
        }
        auto const row = requireVolume(*database_, containerId, uuid);
        auto const endpoint = requireEndpoint(*database_, row, endpointUid);
        if (row.volume.boundTo && *row.volume.boundTo != endpointUid) {
            throw Wire::Failure(Wire::ErrorCode::InUse, "the virtual volume " + row.volume.uuid +
                                                            " is bound to the protocol endpoint " +
                                                            *row.volume.boundTo);
        }
        if (!row.volume.boundTo) {
            if (!endpoint.isAccessible) {
                throw Wire::Failure(Wire::ErrorCode::NoAccessibleEndpoint,
                                    "the protocol endpoint " + endpointUid + " is not accessible");
            }
            database_->query("UPDATE volume SET bound_to = ? WHERE seq = ?")
                .bind(1, endpoint.seq)
                .bind(2, row.seq)
                .run();
        }
        remember(*database_, idempotencyKey, request, std::nullopt);
        transaction.commit();
    });
}

void ArrayFile::unbindVolume(std::string const &idempotencyKey, std::string const &containerId,
                             std::string const &uuid) {
    onFile([&] {
        auto const request = requestText("unbindVirtualVolume", {containerId, uuid});
        Sqlite::Transaction transaction(*database_);
        if (recall(*database_, idempotencyKey, request)) {
            return;
        }
        auto const row = requireVolume(*database_, containerId, uuid);
        if (row.volume.boundTo) {
            database_->query("UPDATE volume SET bound_to = NULL WHERE seq = ?").bind(1, row.seq).run();
        }
        remember(*database_, idempotencyKey, request, std::nullopt);
        transaction.commit();
    });
}

void ArrayFile::setHostContext(std::optional<std::string> const &context) {
    onFile([&] {
        if (context == hostContext()) {
            return; // no write where nothing changes: the daemon tells it again at every start
        }
        Sqlite::Transaction transaction(*database_);
        auto update = database_->query("UPDATE host_context SET context = ?");
        if (context) {
            update.bind(1, *context);
        }
        update.run();
        transaction.commit();
    });
}

} // namespace Orka
