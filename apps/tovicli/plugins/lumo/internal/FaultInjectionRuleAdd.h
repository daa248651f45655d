// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `faultInjection rule add`: adds a rule that says when a fault is injected.
class LUMO_COMMAND_EXPORT FaultInjectionRuleAdd : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<FaultInjectionRuleAdd> New();
    FaultInjectionRuleAdd();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
