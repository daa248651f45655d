// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `orkacontext set`: sets or clears the UUID of the management server on whose behalf the host acts.
class LUMO_COMMAND_EXPORT OrkaContextSet : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<OrkaContextSet> New();
    OrkaContextSet();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
