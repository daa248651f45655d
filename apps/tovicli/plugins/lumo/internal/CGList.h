// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// Lists consistency groups. A placeholder: it asks nobody and lists none.
class LUMO_COMMAND_EXPORT CGList : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<CGList> New();
    CGList();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A consistency group.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
