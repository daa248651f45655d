// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkaprovider activate`: makes a provider the active one for a storage array.
class LUMO_COMMAND_EXPORT VendorProviderActivate : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VendorProviderActivate> New();
    VendorProviderActivate();
    ~VendorProviderActivate() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
