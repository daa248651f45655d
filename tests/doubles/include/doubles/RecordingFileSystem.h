// SPDX-License-Identifier: Apache-2.0
//
// A mounted storage container that answers from a script and records what it is asked, as `fs(label).Operation(...)`.
#pragma once

#include <string>
#include <vector>

#include "doubles/Answers.h"
#include "gantry/Storage.h"

namespace Doubles {

/// What one file system answers. The label names it in the log and is its name unless the script says otherwise.
struct FileSystemScript {
    explicit FileSystemScript(std::string const &scriptLabel)
        : label(scriptLabel)
        , name(scriptLabel)
        , id(scriptLabel + "-id")
        , containerId(scriptLabel + "-container") {}

    std::string label;
    Answers<std::string> name;
    Answers<std::string> id;
    Answers<std::string> containerId;
    Answers<bool> hasContainerId{false};
    Answers<std::vector<Gantry::Storage::LumoAccessibilityType>> accessibility;
    Answers<Done> create;
    Answers<Done> remove;
    Answers<Done> mount;
    Answers<Done> unmount;
};

class RecordingFileSystem : public Gantry::Storage::LumoFileSystem {
public:
    explicit RecordingFileSystem(FileSystemScript const &script);
    ~RecordingFileSystem() override;

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
    std::string line(char const *operation) const;

    FileSystemScript script_;
};

} // namespace Doubles
