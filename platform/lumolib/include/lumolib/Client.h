// SPDX-License-Identifier: Apache-2.0
//
// The Lumo daemon's C++ client, for the platform's own libraries. The C interface that plug-ins use (LumoLib.h) stands
// on the same connection code; this one returns values and throws.
//
// A Client is cheap to make: it connects when it is first asked something, once per channel, and again when the daemon
// has been away. Every operation throws Wire::Failure, whose sentence is ready for the user and names the socket where
// that matters, or std::bad_alloc. Each call has Settings::timeout for itself, however many messages it takes.
//
// An operation that only reads is repeated once, unnoticed, when the daemon had gone away since the last one. One that
// changes something is repeated only when nothing of it had been sent; otherwise the caller hears ConnectionLost and
// knows that the change may have been made. One thread at a time.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "wire/Failure.h"

#define LUMO_CLIENT_EXPORT __attribute__((visibility("default")))

namespace LumoClient {

class Connection;

struct Settings {
    std::string root = "/var/lib/tovi";
    std::chrono::milliseconds timeout{30000};
    /// Names the command in the daemon's log.
    std::string requestId;
    /// Every operation fails at once with DaemonNotRunning; nothing is connected.
    bool offline = false;

    /// TOVI_ROOT, TOVI_TIMEOUT_MS (a positive number; anything else counts as unset), TOVI_REQUEST_ID and TOVI_OFFLINE
    /// (set and not empty).
    LUMO_CLIENT_EXPORT static Settings fromEnvironment();
};

/// Ordered: changes of volumes wait for those asked before. Priority: served ahead of that queue.
enum class Channel { Ordered, Priority };

/// What a running daemon tells about itself.
struct DaemonStatus {
    std::string version;
    std::uint32_t pid = 0;
    std::chrono::milliseconds uptime{0};
    std::string root;
};

struct Container {
    std::string id;
    std::string name;
    std::string providerUrl;
    std::int64_t maxLumoSizeMb = 0;
    std::vector<std::string> arrayIds;
};

/// Names a volume by uuid, or by directory name when the uuid is empty. The container id is canonical.
struct VolumeKey {
    std::string containerId;
    std::string uuid;
    std::string directoryName;
};

/// A volume to be made. The container id is canonical; a size of 0 is the daemon's default.
struct NewVolume {
    std::string containerId;
    std::string directoryName;
    std::string policy;
    std::int64_t sizeMb = 0;
    std::string vmUuid;
};

/// endpoint is the uid of the endpoint that the volume is bound through, empty when it is unbound.
struct Volume {
    std::string uuid;
    std::string directoryName;
    std::string endpoint;
};

class LUMO_CLIENT_EXPORT Client {
public:
    explicit Client(Settings settings);
    ~Client();
    Client(Client const &) = delete;
    Client &operator=(Client const &) = delete;

    DaemonStatus ping();

    /// @param containerId canonical
    /// @param arrayIds    every one must hold the container; empty asks for no particular one
    /// @throw Wire::Failure NoSuchContainer, NoSuchArray and what keeps the daemon from asking
    Container findStorageContainer(std::string const &containerId, std::vector<std::string> const &arrayIds);

    /// Every container that a provider exports, in the order in which the daemon tells them. The views live during the
    /// call.
    using VisitContainer = std::function<void(std::string_view id, std::vector<std::string> const &arrayIds)>;
    void visitStorageContainers(VisitContainer const &visit);

    /// These four return the volume as it is, or was, when they are done.
    Volume createVirtualVolume(NewVolume const &volume, Channel channel);
    Volume bindVirtualVolume(VolumeKey const &key, Channel channel);
    Volume unbindVirtualVolume(VolumeKey const &key, Channel channel);
    Volume deleteVirtualVolume(VolumeKey const &key, Channel channel);

    /// Asks about many volumes at once, in as few requests as the limits of the wire allow.
    /// @return for each id its accessibility as a number: 0 non-existent, 1 unconfirmed, 2 inaccessible, 3 accessible
    std::vector<std::uint8_t> checkLumoAccessibility(std::string const &containerId,
                                                     std::vector<std::string> const &lumoIds);

    /// Tells that all paths of an endpoint went down (apd) or came back.
    /// @return the names of the containers that the endpoint serves
    std::vector<std::string> protocolEndpointEvent(std::string const &endpoint, bool apd);

private:
    Connection &on(Channel channel);

    std::unique_ptr<Connection> ordered_;
    std::unique_ptr<Connection> priority_;
};

} // namespace LumoClient
