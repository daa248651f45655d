// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkaprovider add`: registers a new Orka provider with the host.
class LUMO_COMMAND_EXPORT VendorProviderAdd : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VendorProviderAdd> New();
    VendorProviderAdd();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
