// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `configlumo umount`: makes a config volume's directory disappear.
class LUMO_COMMAND_EXPORT ConfigLumoUmountdir : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<ConfigLumoUmountdir> New();
    ConfigLumoUmountdir();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
