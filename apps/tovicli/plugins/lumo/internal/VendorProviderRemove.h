// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkaprovider remove`: removes a provider's registration from the host.
class LUMO_COMMAND_EXPORT VendorProviderRemove : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VendorProviderRemove> New();
    VendorProviderRemove();
    ~VendorProviderRemove() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
