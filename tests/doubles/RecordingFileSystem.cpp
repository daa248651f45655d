// SPDX-License-Identifier: Apache-2.0
#include "doubles/RecordingFileSystem.h"

#include "doubles/KestrelDouble.h"

namespace Doubles {
namespace {
CallLog &callLog() {
    return KestrelDouble::current().log;
}
} // namespace

RecordingFileSystem::RecordingFileSystem(FileSystemScript const &script)
    : script_(script) {
    ++KestrelDouble::current().liveFileSystems;
}

RecordingFileSystem::~RecordingFileSystem() {
    callLog().call("~fs", Verbatim{script_.label});
    --KestrelDouble::current().liveFileSystems;
}

std::string RecordingFileSystem::line(char const *operation) const {
    return "fs(" + script_.label + ")." + operation;
}

std::string RecordingFileSystem::GetName() {
    callLog().call(line("GetName"));
    return script_.name.next();
}

std::string RecordingFileSystem::GetId() {
    callLog().call(line("GetId"));
    return script_.id.next();
}

void RecordingFileSystem::CreateConfigLumo(std::string const &name, std::string const &policy, int64_t sizeMb,
                                           std::string const &vmUuid, std::string &out, std::string const &extra,
                                           bool priority) {
    callLog().call(line("CreateConfigLumo"), name, policy, sizeMb, vmUuid, out, extra, priority);
    out = "written by the host";
    script_.create.next();
}

void RecordingFileSystem::RemoveConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                           bool priority) {
    callLog().call(line("RemoveConfigLumo"), name, uuid, extra, priority);
    script_.remove.next();
}

void RecordingFileSystem::ReservedConfigLumo(std::string const &first, std::string const &second,
                                             std::string const &extra, bool priority) {
    callLog().call(line("ReservedConfigLumo"), first, second, extra, priority);
}

void RecordingFileSystem::MountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                          bool priority) {
    callLog().call(line("MountConfigLumo"), name, uuid, extra, priority);
    script_.mount.next();
}

void RecordingFileSystem::UnmountConfigLumo(std::string const &name, std::string const &uuid, std::string const &extra,
                                            bool priority) {
    callLog().call(line("UnmountConfigLumo"), name, uuid, extra, priority);
    script_.unmount.next();
}

bool RecordingFileSystem::HasContainerId(std::string const &containerId) {
    callLog().call(line("HasContainerId"), containerId);
    return script_.hasContainerId.next();
}

std::string RecordingFileSystem::GetContainerId() {
    callLog().call(line("GetContainerId"));
    return script_.containerId.next();
}

std::vector<Gantry::Storage::LumoAccessibilityType>
RecordingFileSystem::CheckLumoAccessibility(std::vector<std::string> const &lumoIds) {
    callLog().call(line("CheckLumoAccessibility"), lumoIds);
    return script_.accessibility.next();
}

} // namespace Doubles
