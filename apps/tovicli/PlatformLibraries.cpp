// SPDX-License-Identifier: Apache-2.0
#include "PlatformLibraries.h"

#include <dlfcn.h>
#include <link.h>
#include <string_view>
#include <utility>

#include "lumolib/LastFailure.h"
#include "lumolib/Progress.h"
#include "lumolib/Trace.h"

namespace Tovicli {

namespace {

constexpr char const *framework = "libplexa.so.1"; // linked to this program
constexpr char const *daemonClient = "liblumo.so.1";
constexpr char const *hostControl = "libkestrel.so.1"; // itself needs the daemon's client

extern "C" void passOn(void *context, LumoRequestTrace const *request) {
    auto const &receiver = *static_cast<std::function<void(RequestDone const &)> *>(context);
    receiver({request->method, request->requestId, request->socketPath, request->sentBytes, request->receivedBytes,
              request->replies, request->code, std::chrono::microseconds(request->microseconds)});
}

/// Where a library of that name was loaded from; empty when there is none. To ask dlopen by name would have it search
/// directories for one that is not there.
std::string pathInProcess(std::string const &name) {
    struct Search {
        std::string_view name;
        std::string found;
    } search{name, {}};
    dl_iterate_phdr(
        [](dl_phdr_info *info, std::size_t, void *context) {
            auto &wanted = *static_cast<Search *>(context);
            std::string_view const path = info->dlpi_name;
            bool const isIt = path.substr(path.rfind('/') + 1) == wanted.name;
            if (isIt) {
                wanted.found = path;
            }
            return isIt ? 1 : 0;
        },
        &search);
    return search.found;
}

} // namespace

char const *ourVersionOf(std::string_view needed) {
    for (char const *ours : {framework, daemonClient, hostControl}) {
        std::string_view const unversioned(ours, std::string_view(ours).size() - 2);
        if (needed.substr(0, unversioned.size()) == unversioned &&
            (needed.size() == unversioned.size() || needed[unversioned.size()] == '.')) {
            return ours;
        }
    }
    return nullptr;
}

PlatformLibraries::PlatformLibraries(std::string directory)
    : directory_(std::move(directory)) {}

std::string PlatformLibraries::provide(std::vector<std::string> const &needed) {
    bool needsClient = false;
    bool needsHost = false;
    for (std::string const &name : needed) {
        char const *const ours = ourVersionOf(name);
        if (ours != nullptr && name != ours) {
            return "it was built against " + name + ", this tool has " + ours;
        }
        needsHost = needsHost || name == hostControl;
        needsClient = needsClient || name == daemonClient || name == hostControl;
    }
    std::string problem = needsClient ? load(daemonClient) : std::string();
    return problem.empty() && needsHost ? load(hostControl) : problem;
}

std::string PlatformLibraries::load(std::string const &name) {
    if (loaded_.contains(name)) {
        return {};
    }
    std::string const present = pathInProcess(name);
    std::string const path = present.empty() ? directory_ + "/" + name : present;
    void *const library = dlopen(path.c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (library == nullptr) {
        char const *const text = dlerror();
        return "it needs " + name + ", which cannot be loaded: " + (text != nullptr ? text : "unknown error");
    }
    loaded_[name] = library;
    return {};
}

void *PlatformLibraries::functionOf(char const *name) const {
    auto const client = loaded_.find(daemonClient);
    return client != loaded_.end() ? dlsym(client->second, name) : nullptr;
}

std::optional<LastFailure> PlatformLibraries::lastFailure() const {
    auto const ask = reinterpret_cast<decltype(&LumoPlatform_LastFailure)>(functionOf("LumoPlatform_LastFailure"));
    LumoLastFailure noted{};
    if (ask == nullptr || !ask(&noted)) {
        return std::nullopt;
    }
    return LastFailure{noted.code, noted.sentence, noted.requestId};
}

void PlatformLibraries::clearLastFailure() const {
    auto const clear =
        reinterpret_cast<decltype(&LumoPlatform_ClearLastFailure)>(functionOf("LumoPlatform_ClearLastFailure"));
    if (clear != nullptr) {
        clear();
    }
}

ProgressFunction PlatformLibraries::startProgress() const {
    auto const note = reinterpret_cast<decltype(&LumoPlatform_NoteProgress)>(functionOf("LumoPlatform_NoteProgress"));
    if (note == nullptr) {
        return nullptr;
    }
    note(0, 0);
    return reinterpret_cast<decltype(&LumoPlatform_Progress)>(functionOf("LumoPlatform_Progress"));
}

void PlatformLibraries::traceRequests(std::function<void(RequestDone const &)> receiver) {
    auto const trace =
        reinterpret_cast<decltype(&LumoPlatform_TraceRequests)>(functionOf("LumoPlatform_TraceRequests"));
    if (trace != nullptr) {
        trace(nullptr, nullptr);
        receiver_ = std::move(receiver);
        if (receiver_) {
            trace(passOn, &receiver_);
        }
    }
}

} // namespace Tovicli
