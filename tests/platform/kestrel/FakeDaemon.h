// SPDX-License-Identifier: Apache-2.0
//
// A daemon of a few lines on the real sockets: containers and volumes in memory, and failures on demand. It speaks the
// wire's messages, so that what is tested goes all the way through the client.
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "wire/Failure.h"
#include "wire/UniqueFd.h"
#include "wire/lumod.capnp.h"

class FakeDaemon {
public:
    struct Volume {
        std::string containerId;
        std::string directoryName;
        std::string endpoint;
        std::string policy;
        int64_t sizeMb = 0;
    };

    /// Listens on both sockets of the root; ends with the object.
    explicit FakeDaemon(std::string const &root);
    ~FakeDaemon();
    FakeDaemon(FakeDaemon const &) = delete;
    FakeDaemon &operator=(FakeDaemon const &) = delete;

    void addContainer(std::string const &id, std::string const &name);
    void removeContainer(std::string const &id);
    void addVolume(std::string const &uuid, std::string const &containerId, std::string const &directoryName);
    void addEndpoint(std::string const &uid, std::vector<std::string> const &containerNames);
    void removeVolume(std::string const &uuid);
    /// The next request is answered with this failure.
    void failNext(Wire::ErrorCode code, std::string const &sentence);
    /// The next request is carried out, but the connection ends instead of an answer.
    void hangUpAfterNext();

    std::map<std::string, Volume> volumes();
    /// One line a request, "priority " in front of those on the priority socket; cleared by the call.
    std::vector<std::string> takeRequests();

private:
    void listen(std::string const &path, bool priority);
    void serve(int socket, bool priority);
    void answer(Wire::Request::Reader request, Wire::Reply::Builder reply, bool priority);
    void create(Wire::CreateVirtualVolume::Reader request, Wire::Reply::Builder reply);
    void tellVolume(std::string const &uuid, Wire::Reply::Builder reply);
    std::string find(Wire::VolumeKey::Reader key);

    std::mutex mutex_;
    std::map<std::string, std::string> containers_;
    std::map<std::string, Volume> volumes_;
    std::map<std::string, std::vector<std::string>> endpoints_;
    std::optional<Wire::Failure> failure_;
    bool hangUp_ = false;
    int made_ = 0;
    std::vector<std::string> requests_;
    std::set<int> open_;
    bool stopping_ = false;
    std::vector<Wire::UniqueFd> listeners_;
    std::vector<std::thread> threads_;
};
