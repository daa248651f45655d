// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `configlumo remove`: unmounts and deletes a config volume.
class LUMO_COMMAND_EXPORT ConfigLumoRemove : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<ConfigLumoRemove> New();
    ConfigLumoRemove();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
