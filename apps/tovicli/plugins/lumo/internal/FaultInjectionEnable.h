// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `faultInjection enable`: switches the daemon's provider fault injection on or off.
class LUMO_COMMAND_EXPORT FaultInjectionEnable : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<FaultInjectionEnable> New();
    FaultInjectionEnable();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
