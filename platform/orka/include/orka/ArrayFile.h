// SPDX-License-Identifier: Apache-2.0
//
// The file that is a storage array (or several that one provider serves): what stands in it, and what may be done to
// it. The rules of the model live here and nowhere else, so that every provider that serves such a file answers alike.
//
// Called by the embedded provider inside the daemon and by the array simulator. Every method is one transaction: a
// mutation is durable when it returns and has not happened when it throws. Methods block on the disk, and on another
// process's lock no longer than the busy timeout. An object belongs to one thread; several processes may have the file
// open. Everything throws Wire::Failure: NoSuchContainer where a container is named, File*, DiskFull and IoError for
// the file, FileBusy when the timeout passed, and what a method names.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "orka/Model.h"

namespace Sqlite {
class Database;
}

namespace Orka {

/// How many of each a file holds.
struct ArrayFileCounts {
    int64_t arrays = 0;
    int64_t endpoints = 0;
    int64_t containers = 0;
    int64_t configVolumes = 0;
    int64_t dataVolumes = 0;
    int64_t boundVolumes = 0;
    int64_t metadataPairs = 0;

    bool operator==(ArrayFileCounts const &) const = default;
};

/// Arrays and containers as they stood at one moment. Two of one ArrayFile with the same data version are the same.
struct Inventory {
    std::vector<StorageArray> arrays;
    std::vector<StorageContainer> containers;
    int64_t dataVersion = 0;
};

class ArrayFile {
public:
    /// Opens a file that exists; makeArrayFile (Topology.h) makes one.
    /// @param newUuid gives the ids of new volumes, canonical; null: random ones.
    explicit ArrayFile(std::string const &path, std::chrono::milliseconds busyTimeout = std::chrono::seconds{5},
                       std::function<std::string()> newUuid = nullptr);
    ~ArrayFile();
    ArrayFile(ArrayFile const &) = delete;
    ArrayFile &operator=(ArrayFile const &) = delete;

    std::string const &path() const noexcept;
    /// Whether the path no longer leads to the file that is open.
    bool hasMoved() const;
    /// Changes when somebody else has committed to the file since the last call.
    int64_t dataVersion();
    /// Reads the whole file and throws FileMalformed, naming the first damage.
    void checkIntegrity();
    ArrayFileCounts counts();

    Inventory inventory();

    /// @throws NoSuchVolume
    VirtualVolume volume(std::string const &containerId, std::string const &uuid);
    /// The first `max` of them, in the order of their making. @throws NoSuchContainer
    std::vector<ConfigVolume> configVolumes(std::string const &containerId, int64_t max);
    /// @throws NoSuchContainer
    std::vector<VolumePresence> presence(std::string const &containerId, std::vector<std::string> const &uuids);
    /// @throws NoSuchContainer
    std::optional<VirtualVolume> volumeByDirectoryName(std::string const &containerId,
                                                       std::string const &directoryName);
    std::vector<VirtualVolume> boundVolumes();
    /// @throws NoSuchVolume
    SpaceStats spaceStats(std::string const &containerId, std::string const &uuid);
    /// @throws NoSuchVolume
    UnsharedChunks unsharedChunks(std::string const &containerId, std::string const &uuid);
    /// @throws NoSuchVolume
    Metadata metadata(std::string const &containerId, std::string const &uuid);
    /// On whose behalf the host said that it speaks.
    std::optional<std::string> hostContext();

    // Mutations. A key that is not empty makes a repetition harmless, as Provider.h tells.

    /// @throws NoSuchContainer, AlreadyExists, TooLarge, InvalidArgument
    VirtualVolume createVolume(std::string const &idempotencyKey, VolumeSpec const &spec);
    /// @throws NoSuchVolume, InUse
    void deleteVolume(std::string const &idempotencyKey, std::string const &containerId, std::string const &uuid);
    /// @throws NoSuchVolume, NoSuchEndpoint, NoAccessibleEndpoint, InUse
    void bindVolume(std::string const &idempotencyKey, std::string const &containerId, std::string const &uuid,
                    std::string const &endpointUid);
    /// @throws NoSuchVolume
    void unbindVolume(std::string const &idempotencyKey, std::string const &containerId, std::string const &uuid);
    void setHostContext(std::optional<std::string> const &context);

private:
    std::unique_ptr<Sqlite::Database> database_;
    std::function<std::string()> newUuid_;
};

} // namespace Orka
