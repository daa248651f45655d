// SPDX-License-Identifier: Apache-2.0
//
// The host store: what this host has been told and must not forget. Provider records, mounted containers (Lumo file
// systems), config volumes with content on this host, protocol-endpoint outages and the Orka context, in the file
// host.db of the root directory.
//
// The command-line tool's process writes it; the daemon reads it (Mode::QueryOnly) and watches dataVersion(). The file
// is opened at the first use, not before: an absent file reads as an empty store, and the first write makes it, with
// the root directory if need be. Every write is one transaction, durable when the call returns, and leaves nothing
// behind when it throws. Everything throws Wire::Failure, whose sentence names the file.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "store/Volume.h"

namespace Sqlite {
class Database;
class Transaction;
} // namespace Sqlite

namespace Store {

struct ProviderArray {
    std::string arrayId;
    bool isActive = true;
    int32_t priority = 0;
    bool operator==(ProviderArray const &) const = default;
};

/// A registered Orka provider; the name is the key.
struct Provider {
    std::string name;
    std::string url;
    std::string auxText;
    /// In the order given at registration; empty: every array that the provider exports, active, priority 0.
    std::vector<ProviderArray> arrays;
    bool operator==(Provider const &) const = default;
};

/// A container that is mounted on this host; name and container id are unique, each by itself.
struct FileSystem {
    std::string name;
    /// Canonical.
    std::string containerId;
    /// The arrays that were asked for at the mount; may be empty.
    std::vector<std::string> arrayIds;
    bool operator==(FileSystem const &) const = default;
};

class HostStore {
public:
    enum class Mode { ReadWrite, QueryOnly };

    /// Makes what is asked of the store while it lives, and at most one putVolumes, a single transaction: nobody else
    /// changes the store between a check and the record that depends on it. Undone unless committed. One at a time.
    class Change {
    public:
        explicit Change(HostStore &store);
        ~Change();
        Change(Change const &) = delete;
        Change &operator=(Change const &) = delete;
        /// Durable when it returns.
        void commit();

    private:
        HostStore &store_;
        std::unique_ptr<Sqlite::Transaction> transaction_;
    };

    /// Touches nothing.
    /// @param root        the directory that holds host.db
    /// @param busyTimeout how long to wait for another process's lock; 0 never waits
    HostStore(std::string const &root, Mode mode,
              std::chrono::milliseconds busyTimeout = std::chrono::milliseconds{5000});
    ~HostStore();
    HostStore(HostStore const &) = delete;
    HostStore &operator=(HostStore const &) = delete;

    std::string const &path() const noexcept {
        return path_;
    }
    /// Changes whenever another process has changed, replaced, made or removed the file since the last call.
    int64_t dataVersion();
    /// Reads the whole file and fails with FileMalformed for the first damage. An absent file is sound.
    void checkIntegrity();

    /// In the order of registration.
    std::vector<Provider> providers();
    std::optional<Provider> provider(std::string_view name);
    bool hasProvider(std::string_view name);
    /// Creates or replaces the record of each name; all or none. A replaced record keeps its place.
    void putProviders(std::vector<Provider> const &providers);
    /// @return false when there was no record of that name.
    bool removeProvider(std::string_view name);

    /// In the order in which they were added.
    std::vector<FileSystem> fileSystems();
    /// The same order, without building anything: for hosts with very many file systems. The views live during the
    /// call.
    void visitFileSystems(std::function<void(std::string_view name, std::string_view containerId)> const &visit);
    /// By canonical container id.
    std::optional<FileSystem> fileSystem(std::string_view containerId);
    std::optional<FileSystem> fileSystemNamed(std::string_view name);
    /// Fails with AlreadyExists when the name or the container is there, saying which.
    void addFileSystem(FileSystem const &fileSystem);
    /// Fails with InUse while config volumes are mounted in that container, naming how many and the first.
    void requireNoMounts(std::string_view containerId);
    /// Fails with InUse while config volumes are mounted in it, naming how many and the first. Forgets its unmounted
    /// ones.
    /// @return false when there was none.
    bool removeFileSystem(std::string_view containerId);

    /// Config volumes that are mounted, in the order of their first mount.
    std::vector<Mount> mounts();
    /// Every config volume that the store knows, whether mounted or not, in the order of their first mount.
    std::vector<Volume> volumes();
    /// What the store knows about a config volume on this host, whether mounted or not.
    std::optional<Volume> volume(std::string_view uuid);
    /// The mounted one of that directory name.
    std::optional<Volume> mountedVolume(std::string_view containerId, std::string_view directoryName);
    /// Those that are not mounted and had that directory name: at most a few.
    std::vector<Volume> unmountedVolumes(std::string_view containerId, std::string_view directoryName);
    /// Those whose directory may not be where their state says, because a process was killed on the way.
    std::vector<UnsettledVolume> unsettledVolumes();
    /// Writes the records and, in the same transaction, settles those that are known to be done (see VolumeState).
    /// Fails with AlreadyExists when the directory name of a mounted one is taken in its container.
    void putVolumes(std::vector<Volume> const &volumes, std::vector<Volume> const &settled);

    /// The uids of the endpoints in an outage (all paths down), sorted.
    std::vector<std::string> endpointOutages();
    void setEndpointOutage(std::string_view uid, bool outage);

    std::optional<std::string> orkaContext();
    void setOrkaContext(std::string_view uuid);
    void clearOrkaContext();

private:
    /// Null when the file does not exist.
    Sqlite::Database *reader();
    Sqlite::Database &writer();

    std::string root_;
    std::string path_;
    Mode mode_;
    std::chrono::milliseconds busyTimeout_;
    /// Counts how often the file was opened or found gone: a part of dataVersion().
    int64_t generation_ = 0;
    std::unique_ptr<Sqlite::Database> database_;
    bool changing_ = false;
};

} // namespace Store
