// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `configlumo add`: creates a config volume in a mounted storage container.
class LUMO_COMMAND_EXPORT ConfigLumoAdd : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<ConfigLumoAdd> New();
    ConfigLumoAdd();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
