// SPDX-License-Identifier: Apache-2.0
//
// What is asked about volumes.
#include <algorithm>

#include "FileFailure.h"
#include "VolumeRows.h"
#include "orka/ArrayFile.h"
#include "sqlite/Transaction.h"
#include "wire/ContainerId.h"

namespace Orka {

namespace {

constexpr int64_t bytesPerMb = int64_t{1} << 20;

/// How many chunks of blockSize bytes hold sizeMb, rounded up, but never more than an answer covers.
int64_t chunksOf(int64_t sizeMb, int64_t blockSize) {
    if (blockSize >= bytesPerMb) {
        auto const blockMb = blockSize / bytesPerMb;
        return std::min(sizeMb / blockMb + (sizeMb % blockMb != 0 ? 1 : 0), UnsharedChunks::maxChunks);
    }
    auto const chunksPerMb = bytesPerMb / blockSize;
    return sizeMb >= UnsharedChunks::maxChunks / chunksPerMb ? UnsharedChunks::maxChunks : sizeMb * chunksPerMb;
}

} // namespace

VirtualVolume ArrayFile::volume(std::string const &containerId, std::string const &uuid) {
    return onFile([&] {
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        return requireVolume(*database_, containerId, uuid).volume;
    });
}

std::vector<ConfigVolume> ArrayFile::configVolumes(std::string const &containerId, int64_t max) {
    return onFile([&] {
        std::vector<ConfigVolume> volumes;
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        auto const container = requireContainer(*database_, containerId);
        auto rows = database_->query("SELECT v.uuid, v.directory_name, e.uid FROM volume v "
                                     "LEFT JOIN endpoint e ON e.seq = v.bound_to "
                                     "WHERE v.container = ? AND v.kind = 0 ORDER BY v.seq LIMIT ?");
        // A negative LIMIT would mean none.
        rows.bind(1, container.seq).bind(2, std::max<int64_t>(max, 0));
        while (rows.step()) {
            volumes.push_back({rows.text(0), rows.text(1), optionalText(rows, 2)});
            requireId(*database_, volumes.back().uuid, "a virtual volume");
        }
        return volumes;
    });
}

std::vector<VolumePresence> ArrayFile::presence(std::string const &containerId, std::vector<std::string> const &uuids) {
    return onFile([&] {
        std::vector<VolumePresence> answers;
        answers.reserve(uuids.size());
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        auto const container = requireContainer(*database_, containerId);
        auto row = database_->query("SELECT e.uid FROM volume v LEFT JOIN endpoint e ON e.seq = v.bound_to "
                                    "WHERE v.uuid = ? AND v.container = ?");
        row.bind(2, container.seq);
        for (auto const &uuid : uuids) {
            VolumePresence answer;
            row.bind(1, Wire::normalizeContainerId(uuid).value_or(uuid));
            if (row.step()) {
                answer.exists = true;
                answer.boundTo = optionalText(row, 0);
            }
            row.reset();
            answers.push_back(std::move(answer));
        }
        return answers;
    });
}

std::optional<VirtualVolume> ArrayFile::volumeByDirectoryName(std::string const &containerId,
                                                              std::string const &directoryName) {
    return onFile([&]() -> std::optional<VirtualVolume> {
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        auto const container = requireContainer(*database_, containerId);
        auto row = database_->query(std::string(selectVolumes) + "WHERE v.container = ? AND v.directory_name = ?");
        row.bind(1, container.seq).bind(2, directoryName);
        if (!row.step()) {
            return std::nullopt;
        }
        return volumeOf(*database_, row);
    });
}

std::vector<VirtualVolume> ArrayFile::boundVolumes() {
    return onFile([&] {
        std::vector<VirtualVolume> volumes;
        auto rows = database_->query(std::string(selectVolumes) + "WHERE v.bound_to IS NOT NULL ORDER BY v.seq");
        while (rows.step()) {
            volumes.push_back(volumeOf(*database_, rows));
        }
        return volumes;
    });
}

SpaceStats ArrayFile::spaceStats(std::string const &containerId, std::string const &uuid) {
    auto const found = volume(containerId, uuid);
    return {found.sizeMb, found.committedMb, found.unsharedMb};
}

UnsharedChunks ArrayFile::unsharedChunks(std::string const &containerId, std::string const &uuid) {
    auto const found = volume(containerId, uuid);
    UnsharedChunks answer;
    answer.blockSize = found.blockSize;
    if (!found.unsharedMb) {
        return answer;
    }
    // The file tells how much is unshared, not where: it is taken to lie at the volume's start.
    auto const chunks = static_cast<size_t>(chunksOf(found.sizeMb, found.blockSize));
    auto const unshared = static_cast<size_t>(chunksOf(*found.unsharedMb, found.blockSize));
    answer.bitmap.assign((chunks + 7) / 8, 0);
    std::fill_n(answer.bitmap.begin(), unshared / 8, uint8_t{0xff});
    if (unshared % 8 != 0) {
        answer.bitmap[unshared / 8] = static_cast<uint8_t>((1U << (unshared % 8)) - 1U);
    }
    return answer;
}

Metadata ArrayFile::metadata(std::string const &containerId, std::string const &uuid) {
    return onFile([&] {
        Metadata pairs;
        Sqlite::Transaction transaction(*database_, Sqlite::Transaction::Kind::Read);
        auto const found = requireVolume(*database_, containerId, uuid);
        auto rows = database_->query("SELECT key, value FROM metadata WHERE volume = ? ORDER BY position");
        rows.bind(1, found.seq);
        while (rows.step()) {
            pairs.push_back({rows.text(0), rows.text(1)});
        }
        return pairs;
    });
}

} // namespace Orka
