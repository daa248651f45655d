// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkaprovider injectfault`: makes the daemon act as if a provider's status or active flags had changed.
class LUMO_COMMAND_EXPORT VendorProviderInjectFault : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VendorProviderInjectFault> New();
    VendorProviderInjectFault();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
