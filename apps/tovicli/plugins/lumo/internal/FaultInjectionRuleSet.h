// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `faultInjection rule set`: changes when an existing rule injects its fault.
class LUMO_COMMAND_EXPORT FaultInjectionRuleSet : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<FaultInjectionRuleSet> New();
    FaultInjectionRuleSet();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
