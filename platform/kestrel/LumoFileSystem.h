// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <new>
#include <string>
#include <string_view>

#include "FileSystemBlock.h"
#include "gantry/Storage.h"
#include "wire/ContainerId.h"

namespace Kestrel {

/// A mounted container as the interface hands it out: its name, its id, and the way to the host. Small, because a host
/// may hand out a hundred thousand of them. Stands in a block, behind it its name.
class LumoFileSystem final : public Gantry::Storage::LumoFileSystem {
public:
    ~LumoFileSystem() override = default;
    /// The block decides when the memory goes.
    static void operator delete(LumoFileSystem *fileSystem, std::destroying_delete_t) noexcept;

    std::string GetName() override;
    std::string GetId() override;
    void CreateConfigLumo(std::string const &name, std::string const &policy, int64_t sizeMb, std::string const &vmUuid,
                          std::string &out, std::string const &extra, bool priority) override;
    void RemoveConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                          bool priority) override;
    void ReservedConfigLumo(std::string const &first, std::string const &second, std::string const &extra,
                            bool priority) override;
    void MountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                         bool priority) override;
    void UnmountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                           bool priority) override;

    bool HasContainerId(std::string const &containerId) override;
    std::string GetContainerId() override;
    std::vector<Gantry::Storage::LumoAccessibilityType>
    CheckLumoAccessibility(std::vector<std::string> const &lumoIds) override;

private:
    friend class FileSystemBlock;
    /// @param name        lives as long as the block
    /// @param containerId canonical
    LumoFileSystem(FileSystemBlock &block, std::string_view name, std::string_view containerId) noexcept;

    Host &host() const {
        return *block_.host();
    }
    std::string_view containerId() const {
        return {containerId_.data(), containerId_.size()};
    }

    FileSystemBlock &block_;
    std::string_view name_;
    std::array<char, Wire::containerIdLength> containerId_{};
};

} // namespace Kestrel
