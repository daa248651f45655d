// SPDX-License-Identifier: Apache-2.0
#include "FakeDaemon.h"

#include <chrono>
#include <filesystem>
#include <stdexcept>

#include <capnp/message.h>
#include <capnp/serialize.h>
#include <sys/socket.h>

#include "wire/Framing.h"
#include "wire/Paths.h"
#include "wire/SocketAddress.h"

namespace {

constexpr std::chrono::seconds patience{20};

std::string stringOf(capnp::Text::Reader text) {
    return std::string(text.begin(), text.size());
}

std::string keyOf(Wire::VolumeKey::Reader key) {
    return stringOf(key.getUuid()) + '/' + stringOf(key.getDirectoryName());
}

} // namespace

FakeDaemon::FakeDaemon(std::string const &root) {
    Wire::Paths const paths(root);
    std::filesystem::create_directories(paths.run());
    listen(paths.orderedSocket(), false);
    listen(paths.prioritySocket(), true);
}

FakeDaemon::~FakeDaemon() {
    {
        std::lock_guard const lock(mutex_);
        stopping_ = true;
        for (auto const &listener : listeners_) {
            ::shutdown(listener.get(), SHUT_RDWR);
        }
        for (int const socket : open_) {
            ::shutdown(socket, SHUT_RDWR);
        }
    }
    for (auto &thread : threads_) {
        thread.join();
    }
}

void FakeDaemon::listen(std::string const &path, bool priority) {
    std::filesystem::remove(path);
    Wire::SocketAddress const address(path);
    Wire::UniqueFd listener(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (::bind(listener.get(), address.get(), address.size()) != 0 || ::listen(listener.get(), 16) != 0) {
        throw std::runtime_error("cannot listen on " + path);
    }
    int const number = listener.get();
    listeners_.push_back(std::move(listener));
    // One connection at a time is enough for one client at a time; the next is accepted when it is gone.
    threads_.emplace_back([this, number, priority] {
        for (;;) {
            Wire::UniqueFd const socket(::accept4(number, nullptr, nullptr, SOCK_CLOEXEC));
            {
                std::lock_guard const lock(mutex_);
                if (!socket || stopping_) {
                    return;
                }
                open_.insert(socket.get());
            }
            serve(socket.get(), priority);
            std::lock_guard const lock(mutex_);
            open_.erase(socket.get());
        }
    });
}

void FakeDaemon::serve(int socket, bool priority) {
    try {
        Wire::MessageBuffer buffer;
        while (Wire::receive(socket, buffer, Wire::requestBytesMax, std::chrono::steady_clock::now() + patience)) {
            capnp::SegmentArrayMessageReader message(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
            auto const request = message.getRoot<Wire::Request>();
            capnp::MallocMessageBuilder answered;
            auto reply = answered.initRoot<Wire::Reply>();
            reply.setId(request.getId());
            {
                std::lock_guard const lock(mutex_);
                answer(request, reply, priority);
                if (hangUp_) {
                    hangUp_ = false;
                    return;
                }
            }
            Wire::send(socket, answered, Wire::replyBytesMax, std::chrono::steady_clock::now() + patience);
        }
    } catch (Wire::Failure const &) {
        // The client went away, or the test ends.
    }
}

void FakeDaemon::answer(Wire::Request::Reader request, Wire::Reply::Builder reply, bool priority) {
    auto const note = [&](std::string const &line) { requests_.push_back((priority ? "priority " : "") + line); };
    try {
        if (failure_) {
            Wire::Failure const failure = *failure_;
            failure_.reset();
            note("failed");
            throw failure;
        }
        switch (request.which()) {
        case Wire::Request::FIND_STORAGE_CONTAINER: {
            std::string const id = stringOf(request.getFindStorageContainer().getContainerId());
            note("find " + id);
            for (auto const array : request.getFindStorageContainer().getArrayIds()) {
                if (stringOf(array) == "no-such-array") {
                    throw Wire::Failure(Wire::ErrorCode::NoSuchArray, "no provider serves the array no-such-array");
                }
            }
            if (containers_.count(id) == 0) {
                throw Wire::Failure(Wire::ErrorCode::NoSuchContainer, "no provider exports the container " + id);
            }
            auto container = reply.initStorageContainers(1)[0];
            container.setId(id);
            container.setName(containers_[id]);
            break;
        }
        case Wire::Request::GET_STORAGE_CONTAINER: {
            note("list");
            auto containers = reply.initStorageContainers(static_cast<unsigned>(containers_.size()));
            unsigned next = 0;
            for (auto const &[id, name] : containers_) {
                containers[next].setId(id);
                containers[next++].setName(name);
            }
            break;
        }
        case Wire::Request::CREATE_VIRTUAL_VOLUME:
            note("create " + stringOf(request.getCreateVirtualVolume().getDirectoryName()));
            create(request.getCreateVirtualVolume(), reply);
            break;
        case Wire::Request::BIND_VIRTUAL_VOLUME: {
            note("bind " + keyOf(request.getBindVirtualVolume()));
            std::string const uuid = find(request.getBindVirtualVolume());
            volumes_[uuid].endpoint = "pe-1";
            tellVolume(uuid, reply);
            break;
        }
        case Wire::Request::UNBIND_VIRTUAL_VOLUME: {
            note("unbind " + keyOf(request.getUnbindVirtualVolume()));
            std::string const uuid = find(request.getUnbindVirtualVolume());
            volumes_[uuid].endpoint.clear();
            tellVolume(uuid, reply);
            break;
        }
        case Wire::Request::DELETE_VIRTUAL_VOLUME: {
            note("delete " + keyOf(request.getDeleteVirtualVolume()));
            std::string const uuid = find(request.getDeleteVirtualVolume());
            tellVolume(uuid, reply);
            volumes_.erase(uuid);
            break;
        }
        case Wire::Request::CHECK_LUMO_ACCESSIBILITY: {
            auto const ids = request.getCheckLumoAccessibility().getLumoIds();
            note("check " + std::to_string(ids.size()));
            auto values = reply.initAccessibility(ids.size());
            for (unsigned i = 0; i < ids.size(); ++i) {
                auto const found = volumes_.find(stringOf(ids[i]));
                values[i] = found == volumes_.end() ? 0 : found->second.endpoint.empty() ? 2 : 3;
            }
            break;
        }
        case Wire::Request::PROTOCOL_ENDPOINT_EVENT: {
            auto const event = request.getProtocolEndpointEvent();
            std::string const uid = stringOf(event.getEndpoint());
            note("apd " + uid + (event.getApd() ? " start" : " end"));
            auto const found = endpoints_.find(uid);
            if (found == endpoints_.end()) {
                throw Wire::Failure(Wire::ErrorCode::NoSuchEndpoint, "no array has the protocol endpoint " + uid);
            }
            auto names = reply.initContainerNames(static_cast<unsigned>(found->second.size()));
            for (unsigned i = 0; i < names.size(); ++i) {
                names.set(i, found->second[i]);
            }
            break;
        }
        default:
            note("unexpected");
            throw Wire::Failure(Wire::ErrorCode::UnknownMethod, "the fake daemon does not know this request");
        }
    } catch (Wire::Failure const &failure) {
        auto told = reply.initFailure();
        told.setCode(static_cast<int32_t>(failure.code()));
        told.setSentence(failure.sentence());
    }
}

void FakeDaemon::create(Wire::CreateVirtualVolume::Reader request, Wire::Reply::Builder reply) {
    std::string const uuid = "00000000-0000-0000-0000-" + std::to_string(100000000000 + ++made_);
    volumes_[uuid] = {stringOf(request.getContainerId()),
                      stringOf(request.getDirectoryName()),
                      {},
                      stringOf(request.getPolicy()),
                      request.getSizeMb()};
    tellVolume(uuid, reply);
}

void FakeDaemon::tellVolume(std::string const &uuid, Wire::Reply::Builder reply) {
    auto volume = reply.initVolume();
    volume.setUuid(uuid);
    volume.setDirectoryName(volumes_[uuid].directoryName);
    volume.setEndpoint(volumes_[uuid].endpoint);
}

std::string FakeDaemon::find(Wire::VolumeKey::Reader key) {
    for (auto const &[uuid, volume] : volumes_) {
        bool const named = key.getUuid().size() == 0 ? volume.directoryName == stringOf(key.getDirectoryName())
                                                     : uuid == stringOf(key.getUuid());
        if (named && volume.containerId == stringOf(key.getContainerId())) {
            return uuid;
        }
    }
    throw Wire::Failure(Wire::ErrorCode::NoSuchVolume, "no array has the volume " + keyOf(key));
}

void FakeDaemon::addContainer(std::string const &id, std::string const &name) {
    std::lock_guard const lock(mutex_);
    containers_[id] = name;
}

void FakeDaemon::removeContainer(std::string const &id) {
    std::lock_guard const lock(mutex_);
    containers_.erase(id);
}

void FakeDaemon::addVolume(std::string const &uuid, std::string const &containerId, std::string const &directoryName) {
    std::lock_guard const lock(mutex_);
    volumes_[uuid] = {containerId, directoryName, {}, {}, 0};
}

void FakeDaemon::addEndpoint(std::string const &uid, std::vector<std::string> const &containerNames) {
    std::lock_guard const lock(mutex_);
    endpoints_[uid] = containerNames;
}

void FakeDaemon::removeVolume(std::string const &uuid) {
    std::lock_guard const lock(mutex_);
    volumes_.erase(uuid);
}

void FakeDaemon::failNext(Wire::ErrorCode code, std::string const &sentence) {
    std::lock_guard const lock(mutex_);
    failure_.emplace(code, sentence);
}

void FakeDaemon::hangUpAfterNext() {
    std::lock_guard const lock(mutex_);
    hangUp_ = true;
}

std::map<std::string, FakeDaemon::Volume> FakeDaemon::volumes() {
    std::lock_guard const lock(mutex_);
    return volumes_;
}

std::vector<std::string> FakeDaemon::takeRequests() {
    std::lock_guard const lock(mutex_);
    return std::exchange(requests_, {});
}
