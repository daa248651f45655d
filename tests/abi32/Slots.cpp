// SPDX-License-Identifier: Apache-2.0
//
// Plug-ins call the framework through virtual tables: an operation that moves to another slot breaks every plug-in
// that was built before. In the Itanium ABI a pointer to a virtual member holds one plus the byte offset of its slot.
#include <cstddef>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "gantry/Storage.h"
#include "plexa/AutoCli.h"

namespace {

template <typename Member>
std::size_t slotOf(Member member) {
    struct {
        std::ptrdiff_t pointer;
        std::ptrdiff_t adjustment;
    } parts{};
    static_assert(sizeof(parts) == sizeof(member));
    std::memcpy(&parts, &member, sizeof(parts));
    EXPECT_EQ(parts.pointer % 2, 1) << "not a virtual operation";
    EXPECT_EQ(parts.adjustment, 0) << "not in the class's own table";
    return static_cast<std::size_t>(parts.pointer - 1) / sizeof(void *);
}

using Slots = std::vector<std::pair<std::string, std::size_t>>;

void expectConsecutive(Slots const &slots, std::size_t first) {
    std::size_t expected = first;
    for (auto const &[name, slot] : slots) {
        EXPECT_EQ(slot, expected) << name;
        ++expected;
    }
}

TEST(Slots, NamespaceNodeFollowsItsTwoDestructorEntries) {
    using Plexa::AutoCli::NamespaceNode;
    Slots const slots = {
        {"GetThis", slotOf(&NamespaceNode::GetThis)},
        {"GetType", slotOf(&NamespaceNode::GetType)},
        {"GetName", slotOf(&NamespaceNode::GetName)},
        {"SetName", slotOf(&NamespaceNode::SetName)},
        {"GetDescription", slotOf(&NamespaceNode::GetDescription)},
        {"SetDescription", slotOf(&NamespaceNode::SetDescription)},
        {"GetPath", slotOf(&NamespaceNode::GetPath)},
        {"GetPathString", slotOf(&NamespaceNode::GetPathString)},
        {"HasNamespaceNode", slotOf(&NamespaceNode::HasNamespaceNode)},
        {"GetNamespaceNodeNames", slotOf(&NamespaceNode::GetNamespaceNodeNames)},
        {"GetNamespaceNodes", slotOf(&NamespaceNode::GetNamespaceNodes)},
        {"GetNamespaceNode", slotOf(&NamespaceNode::GetNamespaceNode)},
        {"RegisterNamespaceNode", slotOf(&NamespaceNode::RegisterNamespaceNode)},
        {"ResolveNode", slotOf(&NamespaceNode::ResolveNode)},
        {"SubNamespace", slotOf(&NamespaceNode::SubNamespace)},
        {"GetDispatcher", slotOf(&NamespaceNode::GetDispatcher)},
        {"SetParent", slotOf(&NamespaceNode::SetParent)},
        {"GetParent", slotOf(&NamespaceNode::GetParent)},
    };
    expectConsecutive(slots, 2);
}

TEST(Slots, CommandsOwnOperationsBeginAtTheCallTarget) {
    using Plexa::AutoCli::Command;
    Slots const slots = {
        {"GetInputSpec", slotOf(&Command::GetInputSpec)},
        {"GetOutputSpec", slotOf(&Command::GetOutputSpec)},
        {"Execute", slotOf(&Command::Execute)},
        {"GetThis", slotOf(&Command::GetThis)},
        {"HasNamespaceNode", slotOf(&Command::HasNamespaceNode)},
        {"GetNamespaceNode", slotOf(&Command::GetNamespaceNode)},
        {"RegisterNamespaceNode", slotOf(&Command::RegisterNamespaceNode)},
        {"ResolveNode", slotOf(&Command::ResolveNode)},
        {"GetDispatcher", slotOf(&Command::GetDispatcher)},
        {"SetParent", slotOf(&Command::SetParent)},
        {"GetParent", slotOf(&Command::GetParent)},
        {"GetType", slotOf(&Command::GetType)},
        {"GetExamples", slotOf(&Command::GetExamples)},
        {"GetDefaultOutputFormatParameters", slotOf(&Command::GetDefaultOutputFormatParameters)},
        {"SetDefaultOutputFormatter", slotOf(&Command::SetDefaultOutputFormatter)},
        {"SetDefaultOutputParameter", slotOf(&Command::SetDefaultOutputParameter)},
        {"SetMetaDataField", slotOf(&Command::SetMetaDataField)},
        {"GetMetaDataField", slotOf(&Command::GetMetaDataField)},
        {"GetMetaData", slotOf(&Command::GetMetaData)},
        {"GetInputSpecInternal", slotOf(&Command::GetInputSpecInternal)},
        {"GetOutputSpecInternal", slotOf(&Command::GetOutputSpecInternal)},
        {"ExecuteInternal", slotOf(&Command::ExecuteInternal)},
        {"AddExample", slotOf(&Command::AddExample)},
        {"GenerateHelpOutput", slotOf(&Command::GenerateHelpOutput)},
    };
    expectConsecutive(slots, 0);
}

TEST(Slots, CallTargetHasItsThreeOperationsAndNoDestructor) {
    using Plexa::CallSpec::CallTarget;
    Slots const slots = {
        {"GetInputSpec", slotOf(&CallTarget::GetInputSpec)},
        {"GetOutputSpec", slotOf(&CallTarget::GetOutputSpec)},
        {"Execute", slotOf(&CallTarget::Execute)},
    };
    expectConsecutive(slots, 0);
}

TEST(Slots, ParameterSpecSettersStandFirst) {
    using Plexa::CallSpec::ParameterSpec;
    Slots const slots = {
        {"SetAlias", slotOf(&ParameterSpec::SetAlias)},
        {"SetDescription", slotOf(&ParameterSpec::SetDescription)},
        {"SetRequired", slotOf(&ParameterSpec::SetRequired)},
    };
    expectConsecutive(slots, 0);
}

TEST(Slots, OutputOperationsStandFirst) {
    using Plexa::CallSpec::Output;
    Slots const slots = {
        {"SetMessage", slotOf(&Output::SetMessage)},
        {"SetResult", slotOf(&Output::SetResult)},
        {"Complete", slotOf(&Output::Complete)},
    };
    expectConsecutive(slots, 0);
}

TEST(Slots, LumoFileSystemFollowsTheNineSlotsOfFileSystem) {
    using Gantry::Storage::FileSystem;
    using Gantry::Storage::LumoFileSystem;
    Slots const base = {
        {"GetName", slotOf(&FileSystem::GetName)},
        {"GetId", slotOf(&FileSystem::GetId)},
        {"CreateConfigLumo", slotOf(&FileSystem::CreateConfigLumo)},
        {"RemoveConfigLumo", slotOf(&FileSystem::RemoveConfigLumo)},
        {"ReservedConfigLumo", slotOf(&FileSystem::ReservedConfigLumo)},
        {"MountConfigLumo", slotOf(&FileSystem::MountConfigLumo)},
        {"UnmountConfigLumo", slotOf(&FileSystem::UnmountConfigLumo)},
    };
    expectConsecutive(base, 2);
    Slots const own = {
        {"HasContainerId", slotOf(&LumoFileSystem::HasContainerId)},
        {"GetContainerId", slotOf(&LumoFileSystem::GetContainerId)},
        {"CheckLumoAccessibility", slotOf(&LumoFileSystem::CheckLumoAccessibility)},
    };
    expectConsecutive(own, 9);
}

} // namespace
