// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkaprovider set`: replaces the array list of a provider that the host knows; its URL stays.
class LUMO_COMMAND_EXPORT VendorProviderSet : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VendorProviderSet> New();
    VendorProviderSet();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
