// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// Creates a consistency group. A placeholder: it asks nobody and answers with an empty record.
class LUMO_COMMAND_EXPORT CGCreate : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<CGCreate> New();
    CGCreate();
    ~CGCreate() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A consistency group.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
