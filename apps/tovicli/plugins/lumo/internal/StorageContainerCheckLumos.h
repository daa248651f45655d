// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `storagecontainer checklumos`: whether virtual volumes of a mounted container can be used from this host.
class LUMO_COMMAND_EXPORT StorageContainerCheckLumos : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<StorageContainerCheckLumos> New();
    StorageContainerCheckLumos();
    ~StorageContainerCheckLumos() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A volume and its status.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
