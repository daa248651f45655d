// SPDX-License-Identifier: Apache-2.0
//
// What runs at the other end of the daemon's socket answers a client with any bytes. The input's first byte chooses the
// request, the rest is what comes back: an error with a sentence, or records that are whole and can be freed.
#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <string>
#include <thread>

#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include "Property.h"
#include "Scratch.h"
#include "lumolib/LastFailure.h"
#include "lumolib/LumoLib.h"
#include "wire/Limits.h"
#include "wire/Paths.h"
#include "wire/SocketAddress.h"
#include "wire/UniqueFd.h"

namespace {

using Fuzz::require;

constexpr char const *containerId = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
constexpr char const *volumeId = "11111111-2222-3333-4444-555555555555";

/// Answers the first request of every connection with the input's bytes and closes it. It lives as long as the process.
class Daemon {
public:
    Daemon()
        : paths_(directory_.path())
        , listener_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        std::string const path = paths_.orderedSocket();
        if (::mkdir(directory_.at("run").c_str(), S_IRWXU) != 0) {
            Fuzz::broken("the scratch directory is empty", directory_.path());
        }
        Wire::SocketAddress const address(path);
        if (::bind(listener_.get(), address.get(), address.size()) != 0 || ::listen(listener_.get(), 16) != 0) {
            Fuzz::broken("a socket can be made", path);
        }
        setenv("TOVI_ROOT", directory_.path().c_str(), 1);
        setenv("TOVI_TIMEOUT_MS", "5000", 1);
        std::thread([this] { serve(); }).detach();
    }

    /// What requests from now on are answered with.
    void setAnswer(std::string_view bytes) {
        std::lock_guard const lock(mutex_);
        answer_ = bytes;
    }

private:
    std::string answer() {
        std::lock_guard const lock(mutex_);
        return answer_;
    }

    void serve() {
        for (;;) {
            Wire::UniqueFd const client(::accept4(listener_.get(), nullptr, nullptr, SOCK_CLOEXEC));
            std::array<char, 4096> request;
            if (!client || ::recv(client.get(), request.data(), request.size(), 0) <= 0) {
                continue; // it only looked whether somebody is there
            }
            std::string const bytes = answer();
            std::string_view left = bytes;
            while (!left.empty()) {
                ssize_t const sent = ::send(client.get(), left.data(), left.size(), MSG_NOSIGNAL);
                left.remove_prefix(sent > 0 ? static_cast<std::size_t>(sent) : left.size());
            }
            ::shutdown(client.get(), SHUT_WR);
            while (::recv(client.get(), request.data(), request.size(), 0) > 0) {
            }
        }
    }

    Fuzz::ScratchDirectory directory_;
    Wire::Paths paths_;
    Wire::UniqueFd listener_;
    std::mutex mutex_;
    std::string answer_;
};

/// Texts that may be null are read as well: a sanitizer sees to it that they can be.
std::size_t lengthOf(char const *text) {
    return text != nullptr ? std::strlen(text) : 0;
}

void checkEndpoint(ProtocolEndpointInfo const &endpoint) {
    lengthOf(endpoint.localUID);
    require(endpoint.transport != nullptr, "an endpoint has a transport");
    lengthOf(endpoint.transport->text1);
    lengthOf(endpoint.transport->text2);
    require(endpoint.nfs4xAddressCount >= 0, "addresses are counted");
    for (std::int32_t place = 0; place < endpoint.nfs4xAddressCount; ++place) {
        require(endpoint.nfs4xAddresses[place] != nullptr, "an address is a text");
        lengthOf(endpoint.nfs4xAddresses[place]);
    }
    require(endpoint.isAccessible <= 1 && endpoint.isConfigured <= 1, "truths are 0 or 1");
}

void checkArray(StorageArrayInfo const &array) {
    for (char const *text : {array.arrayId, array.name, array.vendorId, array.modelId}) {
        require(text != nullptr, "an array's texts are there");
        lengthOf(text);
    }
    require(array.endpointCount >= 0, "endpoints are counted");
    for (std::int32_t place = 0; place < array.endpointCount; ++place) {
        checkEndpoint(*array.endpoints[place]);
    }
}

void checkContainers(StorageContainerResult const &result) {
    for (std::uint32_t place = 0; place < result.containerCount; ++place) {
        StorageContainerInfo const &container = *result.containers[place];
        for (char const *text : {container.name, container.providerUrl, container.id}) {
            require(text != nullptr, "a container's texts are there");
            lengthOf(text);
        }
        require(container.arrayCount >= 0 && container.maxLumoSizeMb >= 0, "counts and sizes are not negative");
        for (std::int32_t array = 0; array < container.arrayCount; ++array) {
            checkArray(*container.arrays[array]);
        }
    }
}

/// Either there is a result, or a code and a sentence.
void checkOutcome(std::int32_t code, void const *result) {
    require((code == 0) == (result != nullptr), "a result is there on success and on nothing else");
    LumoLastFailure failure{};
    bool const isNoted = LumoPlatform_LastFailure(&failure);
    require(isNoted == (code != 0), "a failure is noted");
    if (code != 0) {
        require(failure.code == code && lengthOf(failure.sentence) > 0, "a failure says why");
    }
}

void queryContainers() {
    StorageContainerResult *result = nullptr;
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &result);
    checkOutcome(error.code, result);
    require(std::memchr(error.text, '\0', sizeof error.text) != nullptr, "an error's text ends");
    if (result != nullptr) {
        checkContainers(*result);
    }
    LumoLib_FreeStorageContainerResult(result);
}

void queryConfigLumos() {
    LumoQueryResult *result = nullptr;
    checkOutcome(LumoLib_QueryAllConfigLumos(containerId, 1024, 0, &result, 0), result);
    for (std::int32_t place = 0; result != nullptr && place < result->count; ++place) {
        require(result->entries[place]->id != nullptr, "a config volume has an id");
        lengthOf(result->entries[place]->id);
        lengthOf(result->entries[place]->directoryName);
    }
    LumoLib_FreeQueryResult(result);
}

void inspect(unsigned which) {
    if (which == 0) {
        LumoSpaceStats *stats = nullptr;
        checkOutcome(LumoLib_SpaceStatsForLumo(containerId, volumeId, &stats), stats);
        if (stats != nullptr) {
            require(stats->logicalSize >= 0 && stats->committedSize >= 0, "sizes are not negative");
            require(stats->unsharedSizeValid <= 1, "truths are 0 or 1");
        }
        LumoLib_FreeLumoSpaceStatsInfo(stats);
    } else if (which == 1) {
        LumoInfo *info = nullptr;
        checkOutcome(LumoLib_GetLumoInfo(containerId, volumeId, &info), info);
        if (info != nullptr) {
            lengthOf(info->storageProfile);
        }
        LumoLib_FreeLumoInfo(info);
    } else {
        LumoUnsharedChunks *chunks = nullptr;
        checkOutcome(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, &chunks), chunks);
        if (chunks != nullptr) {
            require(chunks->blockSize >= 0 && chunks->chunkCount >= 0, "sizes are not negative");
            auto const *const bitmap = reinterpret_cast<std::uint8_t const *>(chunks + 1);
            std::for_each_n(bitmap, (chunks->chunkCount + 7) / 8,
                            [](std::uint8_t const volatile &byte) { (void)byte; });
        }
        std::free(chunks);
    }
}

void queryMetadata() {
    LumoMetadata *metadata = nullptr;
    checkOutcome(LumoLib_GetLumoMetadata(containerId, volumeId, &metadata), metadata);
    for (auto const *entry = metadata != nullptr ? metadata->first : nullptr; entry != nullptr; entry = entry->next) {
        require(entry->key != nullptr && entry->value != nullptr, "a pair has two texts");
        lengthOf(entry->key);
        lengthOf(entry->value);
    }
    LumoLib_FreeLumoMetadata(metadata);
}

void change() {
    std::int32_t const code = LumoLib_DeactivateProvider("array", "provider");
    checkOutcome(code, code == 0 ? "done" : nullptr);
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    static Daemon *const daemon = new Daemon; // its thread is there until the end
    if (size == 0) {
        return 0;
    }
    daemon->setAnswer(Fuzz::textOf(data + 1, size - 1));
    LumoPlatform_ClearLastFailure();
    require(LumoLib_Init(0, 0), "a session opens");
    switch (data[0] % 7) {
    case 0:
        queryContainers();
        break;
    case 1:
        queryConfigLumos();
        break;
    case 2:
    case 3:
    case 4:
        inspect(data[0] % 7U - 2U);
        break;
    case 5:
        queryMetadata();
        break;
    default:
        change();
        break;
    }
    LumoLib_Exit();
    return 0;
}
