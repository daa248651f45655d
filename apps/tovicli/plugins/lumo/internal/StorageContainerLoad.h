// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// A storage array as the command prints it: its protocol endpoints as one line of text each.
struct SAInfo {
    std::string ArrayId;
    std::string Name;
    std::string VendorId;
    std::string ModelId;
    std::vector<std::string> PEInfo;
};

/// `storagecontainer load`: mounts every exported container that the host does not have yet, and lists what it mounted.
class LUMO_COMMAND_EXPORT StorageContainerLoad : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<StorageContainerLoad> New();
    StorageContainerLoad();
    ~StorageContainerLoad() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A container.
    StructPtr GetOutputStructure();
    /// An array of a container.
    StructPtr GetStorageArrayStructure();
    /// @return the arrays as structures, in their order.
    ListPtr GetStorageArrayList(std::vector<SAInfo> &arrays);
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
