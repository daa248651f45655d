// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "Host.h"

namespace Kestrel {

/// Mounts, unmounts and removes the config volumes of one container. Each operation is one daemon round trip, one
/// durable transaction and one rename. The daemon goes first: when it refuses, or is not there, nothing has changed
/// here. A volume is named by its uuid or, when that is empty, by its directory name. Everything throws Wire::Failure.
class ConfigVolumes {
public:
    ConfigVolumes(Host &host, std::string containerName, std::string containerId, LumoClient::Channel channel);

    void mount(std::string const &name, std::string const &uuid);
    void unmount(std::string const &name, std::string const &uuid);
    /// Also finishes a removal that was cut off after the array had deleted the volume.
    void remove(std::string const &name, std::string const &uuid);

private:
    LumoClient::VolumeKey keyOf(std::string const &name, std::string const &uuid) const;
    /// The record of a volume of this container, mounted or not; by name only a mounted one.
    std::optional<Store::Volume> recordOf(LumoClient::VolumeKey const &key);
    /// What this host still has of a volume: the mounted one, or by name every one that was put away under it.
    std::vector<Store::Volume> recordsOf(LumoClient::VolumeKey const &key, std::vector<Store::Volume> const &settled);
    /// The record of a volume of any container, which need not be read when its change has just been finished.
    std::optional<Store::Volume> recordAfter(std::vector<Store::Volume> const &settled, std::string const &uuid);
    Store::Volume requireMounted(LumoClient::VolumeKey const &key);
    void place(LumoClient::Volume const &bound);
    void forget(Store::Volume const &volume);
    /// After a failure: a commit that failed may have taken effect, and a store that cannot be read tells nothing.
    bool mayBeMounted(std::string const &uuid);
    void bindQuietly(std::string const &uuid);
    void unbindQuietly(std::string const &uuid);

    Host &host_;
    std::string containerName_;
    std::string containerId_;
    LumoClient::Channel channel_;
};

} // namespace Kestrel
