// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `storagecontainer add`: mounts one storage container under a given name.
class LUMO_COMMAND_EXPORT StorageContainerAdd : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<StorageContainerAdd> New();
    StorageContainerAdd();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
