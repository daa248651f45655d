// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// Adds virtual volumes to a consistency group. A placeholder: it asks nobody and succeeds.
class LUMO_COMMAND_EXPORT CGAdd : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<CGAdd> New();
    CGAdd();
    ~CGAdd() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
