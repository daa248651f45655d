// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `configlumo mount`: makes a config volume appear as a directory.
class LUMO_COMMAND_EXPORT ConfigLumoMountdir : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<ConfigLumoMountdir> New();
    ConfigLumoMountdir();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
