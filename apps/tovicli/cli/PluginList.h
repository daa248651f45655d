// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Frame.h"

namespace Tovicli::Cli {

/// `cli plugin list`: every file of the plug-in directory, and what became of it.
class PluginList : public CliCommand {
public:
    explicit PluginList(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace Tovicli::Cli
