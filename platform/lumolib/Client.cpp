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

void fillTexts(Compact::List<Compact::Text>::Builder list, std::string const *texts) {
    for (unsigned place = 0; place < list.size(); ++place) {
        list.set(place, texts[place]);
    }
}

void fillKey(Compact::VolumeKey::Builder builder, VolumeKey const &key) {
    builder.setContainerId(key.containerId);
    builder.setUuid(key.uuid);
    builder.setDirectoryName(key.directoryName);
}

/// The ids of the arrays that the replies of one answer have told so far; containers name them by their places.
class ArrayTable {
public:
    explicit ArrayTable(Connection const &connection)
        : connection_(connection) {}

    void take(Compact::List<Compact::StorageArray>::Reader arrays) {
        connection_.requireChunk(arrays.size());
        for (Compact::StorageArray::Reader const array : arrays) {
            ids_.emplace_back(array.getId());
        }
    }

    /// Replaces what is in `ids`, whose memory is used again.
    void idsOf(Compact::StorageContainer::Reader container, std::vector<std::string> &ids) const {
        ids.clear();
        for (std::uint32_t const place : container.getArrays()) {
            if (place >= ids_.size()) {
                throw connection_.unexpected("a container names array " + std::to_string(place) + " of " +
                                             std::to_string(ids_.size()));
            }
            ids.push_back(ids_[place]);
        }
    }

private:
    Connection const &connection_;
    std::vector<std::string> ids_;
};

/// One reply on the way to a single container: arrays for the table, then the container.
void takeContainer(Connection const &connection, Compact::Reply::Reader reply, ArrayTable &table,
                   std::optional<Container> &found) {
    if (reply.isStorageArrays()) {
        table.take(reply.getStorageArrays());
    } else if (reply.isStorageContainers()) {
        Compact::List<Compact::StorageContainer>::Reader const containers = reply.getStorageContainers();
        if (containers.size() + (found ? 1 : 0) > 1) {
            throw connection.unexpected("it answered several containers of one id");
        }
        for (Compact::StorageContainer::Reader const answered : containers) {
            found = Container{std::string(answered.getId()),
                              std::string(answered.getName()),
                              std::string(answered.getProviderUrl()),
                              answered.getMaxLumoSizeMb(),
                              {}};
            table.idsOf(answered, found->arrayIds);
        }
    } else if (!reply.isDone()) {
        throw connection.unexpected("it answered something else than a storage container");
    }
}

/// The answer of the four requests that change a volume.
Volume changeVolume(Connection &connection, Connection::Fill fill) {
    Volume volume;
    connection.request(Repeat::OnlyIfUnsent, connection.deadline(), fill, [&](Compact::Reply::Reader reply) {
        if (!reply.isVolume()) {
            throw connection.unexpected("it answered something else than a volume");
        }
        Compact::Volume::Reader const answered = reply.getVolume();
        volume.uuid = answered.getUuid();
        volume.directoryName = answered.getDirectoryName();
        volume.endpoint = answered.getEndpoint();
    });
    return volume;
}

/// @return how many of the ids from the first on fit into one request; at least one, should it fit or not
std::size_t chunkLength(std::vector<std::string> const &ids, std::size_t first) {
    std::size_t bytes = otherBytes;
    std::size_t end = first;
    while (end < ids.size() && end - first < Wire::lumoIdsPerRequest) {
        bytes += Compact::bytesPerWord * (2 + ids[end].size() / Compact::bytesPerWord);
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
        Repeat::Always, ordered_->deadline(), [](Compact::Request::Builder request) { request.setPing(); },
        [&](Compact::Reply::Reader reply) {
            if (!reply.isPong()) {
                throw ordered_->unexpected("it answered something else than a pong");
            }
            Compact::Pong::Reader const pong = reply.getPong();
            status.version = pong.getVersion();
            status.pid = pong.getPid();
            status.uptime = std::chrono::milliseconds(std::min<std::uint64_t>(pong.getUptimeMs(), INT64_MAX));
            status.root = pong.getRoot();
        });
    return status;
}

Container Client::findStorageContainer(std::string const &containerId, std::vector<std::string> const &arrayIds) {
    ArrayTable table(*ordered_);
    std::optional<Container> found;
    ordered_->request(
        Repeat::Always, ordered_->deadline(),
        [&](Compact::Request::Builder request) {
            Compact::FindStorageContainer::Builder query = request.initFindStorageContainer();
            query.setContainerId(containerId);
            fillTexts(query.initArrayIds(static_cast<unsigned>(arrayIds.size())), arrayIds.data());
        },
        [&](Compact::Reply::Reader reply) { takeContainer(*ordered_, reply, table, found); });
    if (!found) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchContainer,
                            "no provider exports the storage container " + containerId);
    }
    return *found;
}

void Client::visitStorageContainers(VisitContainer const &visit) {
    ArrayTable table(*ordered_);
    std::vector<std::string> arrayIds;
    ordered_->request(
        Repeat::Always, ordered_->deadline(),
        [](Compact::Request::Builder request) { request.setGetStorageContainer(); },
        [&](Compact::Reply::Reader reply) {
            if (reply.isStorageArrays()) {
                table.take(reply.getStorageArrays());
            } else if (reply.isStorageContainers()) {
                Compact::List<Compact::StorageContainer>::Reader const containers = reply.getStorageContainers();
                ordered_->requireChunk(containers.size());
                for (Compact::StorageContainer::Reader const container : containers) {
                    table.idsOf(container, arrayIds);
                    visit(container.getId(), arrayIds);
                }
            } else if (!reply.isDone()) {
                throw ordered_->unexpected("it answered something else than storage containers");
            }
        });
}

Volume Client::createVirtualVolume(NewVolume const &volume, Channel channel) {
    return changeVolume(on(channel), [&](Compact::Request::Builder request) {
        Compact::CreateVirtualVolume::Builder creation = request.initCreateVirtualVolume();
        creation.setContainerId(volume.containerId);
        creation.setDirectoryName(volume.directoryName);
        creation.setPolicy(volume.policy);
        creation.setSizeMb(volume.sizeMb);
        creation.setVmUuid(volume.vmUuid);
    });
}

Volume Client::bindVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Compact::Request::Builder request) { fillKey(request.initBindVirtualVolume(), key); });
}

Volume Client::unbindVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Compact::Request::Builder request) { fillKey(request.initUnbindVirtualVolume(), key); });
}

Volume Client::deleteVirtualVolume(VolumeKey const &key, Channel channel) {
    return changeVolume(on(channel),
                        [&](Compact::Request::Builder request) { fillKey(request.initDeleteVirtualVolume(), key); });
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
            [&](Compact::Request::Builder request) {
                Compact::CheckLumoAccessibility::Builder check = request.initCheckLumoAccessibility();
                check.setContainerId(containerId);
                fillTexts(check.initLumoIds(static_cast<unsigned>(count)), &lumoIds[first]);
            },
            [&](Compact::Reply::Reader reply) {
                if (!reply.isAccessibility()) {
                    throw ordered_->unexpected("it answered something else than accessibilities");
                }
                std::span<std::uint8_t const> const values = reply.getAccessibility();
                if (values.size() > first + count - result.size()) {
                    throw ordered_->unexpected("it answered the accessibility of more volumes than were asked about");
                }
                for (std::uint8_t const value : values) {
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
        [&](Compact::Request::Builder request) {
            Compact::ProtocolEndpointEvent::Builder event = request.initProtocolEndpointEvent();
            event.setEndpoint(endpoint);
            event.setApd(apd);
        },
        [&](Compact::Reply::Reader reply) {
            if (reply.isDone()) {
                return;
            }
            if (!reply.isContainerNames()) {
                throw ordered_->unexpected("it answered something else than container names");
            }
            Compact::List<Compact::Text>::Reader const answered = reply.getContainerNames();
            ordered_->requireChunk(answered.size());
            for (std::string_view const name : answered) {
                names.emplace_back(name);
            }
        });
    return names;
}

} // namespace LumoClient
