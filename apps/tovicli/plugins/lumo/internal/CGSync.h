// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// Synchronises consistency groups. A placeholder: it asks nobody and lists none.
class LUMO_COMMAND_EXPORT CGSync : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<CGSync> New();
    CGSync();
    ~CGSync() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// The outcome for one consistency group.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
