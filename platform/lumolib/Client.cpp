// SPDX-License-Identifier: Apache-2.0
#include "lumolib/Client.h"

#include <algorithm>
#include <optional>

#include "Connection.h"
#include "lumolib/Progress.h"
#include "wire/Limits.h"
#include "wire/Paths.h"

namespace LumoClient {

namespace {

/// What a request holds besides its list of ids, amply.
constexpr std::size_t otherBytes = 4096;
constexpr std::uint8_t highestAccessibility = 3;

std::string stringOf(capnp::Text::Reader text) {
    return std::string(text.begin(), text.size());
}

void fillTexts(capnp::List<capnp::Text>::Builder list, std::string const *texts) {
    for (unsigned place = 0; place < list.size(); ++place) {
        list.set(place, textOf(texts[place]));
    }
}

void fillKey(Wire::VolumeKey::Builder builder, VolumeKey const &key) {
    builder.setContainerId(textOf(key.containerId));
    builder.setUuid(textOf(key.uuid));
    builder.setDirectoryName(textOf(key.directoryName));
}

Container containerOf(Connection const &connection, Wire::StorageContainer::Reader answered,
                      std::vector<std::string> const &table) {
    Container container;
    container.id = stringOf(answered.getId());
    container.name = stringOf(answered.getName());
    container.providerUrl = stringOf(answered.getProviderUrl());
    container.maxLumoSizeMb = answered.getMaxLumoSizeMb();
    for (std::uint32_t const place : answered.getArrays()) {
        if (place >= table.size()) {
            throw connection.unexpected("a container names array " + std::to_string(place) + " of " +
                                        std::to_string(table.size()));
        }
        container.arrayIds.push_back(table[place]);
    }
    return container;
}

/// One reply on the way to a single container: arrays for the table, then the container.
void takeContainer(Connection const &connection, Wire::Reply::Reader reply, std::vector<std::string> &table,
                   std::optional<Container> &found) {
    if (reply.isStorageArrays()) {
        capnp::List<Wire::StorageArray>::Reader const arrays = reply.getStorageArrays();
        connection.requireChunk(arrays.size());
        for (Wire::StorageArray::Reader const array : arrays) {
            table.push_back(stringOf(array.getId()));
        }
    } else if (reply.isStorageContainers()) {
        capnp::List<Wire::StorageContainer>::Reader const containers = reply.getStorageContainers();
        if (containers.size() + (found ? 1 : 0) > 1) {
            throw connection.unexpected("it answered several containers of one id");
        }
        if (containers.size() == 1) {
            found = containerOf(connection, containers[0], table);
        }
    } else if (!reply.isDone()) {
        throw connection.unexpected("it answered something else than a storage container");
    }
}

/// The answer of the four requests that change a volume.
Volume changeVolume(Connection &connection, Connection::Fill fill) {
    Volume volume;
    connection.request(Repeat::OnlyIfUnsent, connection.deadline(), kj::mv(fill), [&](Wire::Reply::Reader reply) {
        if (!reply.isVolume()) {
            throw connection.unexpected("it answered something else than a volume");
        }
        Wire::Volume::Reader const answered = reply.getVolume();
        volume.uuid = stringOf(answered.getUuid());
        volume.directoryName = stringOf(answered.getDirectoryName());
        volume.endpoint = stringOf(answered.getEndpoint());
    });
    return volume;
}

/// @return how many of the ids from the first on fit into one request; at least one, should it fit or not
std::size_t chunkLength(std::vector<std::string> const &ids, std::size_t first) {
    std::size_t bytes = otherBytes;
    std::size_t end = first;
    while (end < ids.size() && end - first < Wire::lumoIdsPerRequest) {
        bytes += sizeof(capnp::word) * (2 + ids[end].size() / sizeof(capnp::word));
        if (bytes > Wire::requestBytesMax && end > first) {
            break;
        }
        ++end;
    }
    return end - first;
}

} // namespace

Client::Client(Settings settings)
    : ordered_(std::make_unique<Connection>(Wire::Paths(settings.root).orderedSocket(), settings))
    , priority_(std::make_unique<Connection>(Wire::Paths(settings.root).prioritySocket(), settings)) {}

Client::~Client() = default;

Connection &Client::on(Channel channel) {
    return channel == Channel::Priority ? *priority_ : *ordered_;
}

DaemonStatus Client::ping() {
    DaemonStatus status;
    ordered_->request(
        Repeat::Always, ordered_->deadline(), [](Wire::Request::Builder request) { request.setPing(); },
        [&](Wire::Reply::Reader reply) {
            if (!reply.isPong()) {
                throw ordered_->unexpected("it answered something else than a pong");
            }
            Wire::Pong::Reader const pong = reply.getPong();
            status.version = stringOf(pong.getVersion());
            status.pid = pong.getPid();
            status.uptime = std::chrono::milliseconds(std::min<std::uint64_t>(pong.getUptimeMs(), INT64_MAX));
            status.root = stringOf(pong.getRoot());
        });
    return status;
}

Container Client::findStorageContainer(std::string const &containerId, std::vector<std::string> const &arrayIds) {
    std::vector<std::string> table;
    std::optional<Container> found;
    ordered_->request(
        Repeat::Always, ordered_->deadline(),
        [&](Wire::Request::Builder request) {
            Wire::FindStorageContainer::Builder query = request.initFindStorageContainer();
            query.setContainerId(textOf(containerId));
            fillTexts(query.initArrayIds(static_cast<unsigned>(arrayIds.size())), arrayIds.data());
        },
        [&](Wire::Reply::Reader reply) { takeContainer(*ordered_, reply, table, found); });
    if (!found) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchContainer,
                            "no provider exports the storage container " + containerId);
    }
    return *found;
}

Volume Client::createVirtualVolume(NewVolume const &volume, Channel channel) {
    return changeVolume(on(channel), [&](Wire::Request::Builder request) {
        Wire::CreateVirtualVolume::Builder creation = request.initCreateVirtualVolume();
        creation.setContainerId(textOf(volume.containerId));
        creation.setDirectoryName(textOf(volume.directoryName));
        creation.setPolicy(textOf(volume.policy));
        creation.setSizeMb(volume.sizeMb);
        creation.setVmUuid(textOf(volume.vmUuid));
    });
}

Volume Client::bindVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Wire::Request::Builder request) { fillKey(request.initBindVirtualVolume(), key); });
}

Volume Client::unbindVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Wire::Request::Builder request) { fillKey(request.initUnbindVirtualVolume(), key); });
}

Volume Client::deleteVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Wire::Request::Builder request) { fillKey(request.initDeleteVirtualVolume(), key); });
}

std::vector<std::uint8_t> Client::checkLumoAccessibility(std::string const &containerId,
                                                         std::vector<std::string> const &lumoIds) {
    Wire::Deadline const deadline = ordered_->deadline();
    std::vector<std::uint8_t> result;
    result.reserve(lumoIds.size());
    for (std::size_t first = 0; first < lumoIds.size();) {
        std::size_t const count = chunkLength(lumoIds, first);
        ordered_->request(
            Repeat::Always, deadline,
            [&](Wire::Request::Builder request) {
                Wire::CheckLumoAccessibility::Builder check = request.initCheckLumoAccessibility();
                check.setContainerId(textOf(containerId));
                fillTexts(check.initLumoIds(static_cast<unsigned>(count)), &lumoIds[first]);
            },
            [&](Wire::Reply::Reader reply) {
                if (!reply.isAccessibility()) {
                    throw ordered_->unexpected("it answered something else than accessibilities");
                }
                capnp::Data::Reader const values = reply.getAccessibility();
                if (values.size() > first + count - result.size()) {
                    throw ordered_->unexpected("it answered the accessibility of more volumes than were asked about");
                }
                for (kj::byte const value : values) {
                    if (value > highestAccessibility) {
                        throw ordered_->unexpected("it answered the accessibility " + std::to_string(value));
                    }
                    result.push_back(value);
                }
            });
        first += count;
        LumoPlatform_NoteProgress(first, lumoIds.size());
        if (result.size() != first) {
            throw ordered_->unexpected("it answered the accessibility of " + std::to_string(result.size()) +
                                       " volumes instead of " + std::to_string(first));
        }
    }
    return result;
}

/// Saying it twice changes nothing, so it may always be repeated.
std::vector<std::string> Client::protocolEndpointEvent(std::string const &endpoint, bool apd) {
    std::vector<std::string> names;
    ordered_->request(
        Repeat::Always, ordered_->deadline(),
        [&](Wire::Request::Builder request) {
            Wire::ProtocolEndpointEvent::Builder event = request.initProtocolEndpointEvent();
            event.setEndpoint(textOf(endpoint));
            event.setApd(apd);
        },
        [&](Wire::Reply::Reader reply) {
            if (reply.isDone()) {
                return;
            }
            if (!reply.isContainerNames()) {
                throw ordered_->unexpected("it answered something else than container names");
            }
            capnp::List<capnp::Text>::Reader const answered = reply.getContainerNames();
            ordered_->requireChunk(answered.size());
            for (capnp::Text::Reader const name : answered) {
                names.push_back(stringOf(name));
            }
        });
    return names;
}

} // namespace LumoClient
