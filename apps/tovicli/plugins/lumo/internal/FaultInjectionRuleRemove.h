// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `faultInjection rule remove`: removes a rule.
class LUMO_COMMAND_EXPORT FaultInjectionRuleRemove : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<FaultInjectionRuleRemove> New();
    FaultInjectionRuleRemove();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
