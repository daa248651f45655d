// SPDX-License-Identifier: Apache-2.0
#include "LumoFileSystem.h"

#include <algorithm>
#include <utility>

#include "ConfigVolumes.h"
#include "Edge.h"
#include "Host.h"
#include "Names.h"

namespace Kestrel {
namespace {

LumoClient::Channel channelFor(bool priority) {
    return priority ? LumoClient::Channel::Priority : LumoClient::Channel::Ordered;
}

bool isAway(Wire::ErrorCode code) {
    return code == Wire::ErrorCode::DaemonNotRunning || code == Wire::ErrorCode::ConnectionLost ||
           code == Wire::ErrorCode::DeadlineExceeded || code == Wire::ErrorCode::ShuttingDown;
}

} // namespace

LumoFileSystem::LumoFileSystem(FileSystemBlock &block, std::string_view name, std::string_view containerId) noexcept
    : block_(block)
    , name_(name) {
    std::copy_n(containerId.begin(), std::min(containerId.size(), containerId_.size()), containerId_.begin());
}

void LumoFileSystem::operator delete(LumoFileSystem *fileSystem, std::destroying_delete_t) noexcept {
    FileSystemBlock &block = fileSystem->block_;
    fileSystem->~LumoFileSystem();
    block.letGo();
}

std::string LumoFileSystem::GetName() {
    return std::string(name_);
}

std::string LumoFileSystem::GetId() {
    return std::string(containerId());
}

std::string LumoFileSystem::GetContainerId() {
    return std::string(containerId());
}

bool LumoFileSystem::HasContainerId(std::string const &containerId) {
    // Most callers pass the canonical form and ask every file system in turn.
    if (containerId == this->containerId()) {
        return true;
    }
    auto const canonical = Wire::normalizeContainerId(containerId);
    return canonical && *canonical == this->containerId();
}

void LumoFileSystem::CreateConfigLumo(std::string const &name, std::string const &policy, int64_t sizeMb,
                                      std::string const &vmUuid, std::string &out, std::string const & /*extra*/,
                                      bool priority) {
    atEdge([&] {
        requireDirectoryName(name, "directory name");
        if (sizeMb < 0) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                                "the size of a config volume cannot be " + std::to_string(sizeMb) +
                                    " MB: a positive number, or 0 for the default, is expected");
        }
        out = host()
                  .client
                  .createVirtualVolume({std::string(containerId()), name, policy, sizeMb, vmUuid}, channelFor(priority))
                  .uuid;
    });
}

void LumoFileSystem::RemoveConfigLumo(std::string const &name, std::string const &uuid, std::string const & /*extra*/,
                                      bool priority) {
    atEdge([&] {
        ConfigVolumes(host(), std::string(name_), std::string(containerId()), channelFor(priority)).remove(name, uuid);
    });
}

void LumoFileSystem::ReservedConfigLumo(std::string const & /*first*/, std::string const & /*second*/,
                                        std::string const & /*extra*/, bool /*priority*/) {
    atEdge([] {
        throw Wire::Failure(Wire::ErrorCode::UnknownMethod, "this host has no such operation on config volumes");
    });
}

void LumoFileSystem::MountConfigLumo(std::string const &name, std::string const &uuid, std::string const & /*extra*/,
                                     bool priority) {
    atEdge([&] {
        ConfigVolumes(host(), std::string(name_), std::string(containerId()), channelFor(priority)).mount(name, uuid);
    });
}

void LumoFileSystem::UnmountConfigLumo(std::string const &name, std::string const &uuid, std::string const & /*extra*/,
                                       bool priority) {
    atEdge([&] {
        ConfigVolumes(host(), std::string(name_), std::string(containerId()), channelFor(priority)).unmount(name, uuid);
    });
}

std::vector<Gantry::Storage::LumoAccessibilityType>
LumoFileSystem::CheckLumoAccessibility(std::vector<std::string> const &lumoIds) {
    return atEdge([&] {
        std::vector<Gantry::Storage::LumoAccessibilityType> accessibility;
        if (lumoIds.empty()) {
            return accessibility;
        }
        accessibility.reserve(lumoIds.size());
        try {
            for (std::uint8_t const value : host().client.checkLumoAccessibility(std::string(containerId()), lumoIds)) {
                accessibility.push_back(static_cast<Gantry::Storage::LumoAccessibilityType>(value));
            }
        } catch (Wire::Failure const &failure) {
            if (!isAway(failure.code())) {
                throw;
            }
            // Without a daemon nobody can confirm any of them; that is an answer, and the tool tells the cause.
            LumoPlatform_NoteFailure(static_cast<int32_t>(failure.code()), failure.sentence().c_str());
            accessibility.assign(lumoIds.size(), Gantry::Storage::Unconfirmed);
        }
        return accessibility;
    });
}

} // namespace Kestrel
