// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `storagecontainer remove`: takes one storage container off the host.
class LUMO_COMMAND_EXPORT StorageContainerRemove : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<StorageContainerRemove> New();
    StorageContainerRemove();
    ~StorageContainerRemove() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
