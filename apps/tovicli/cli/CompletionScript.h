// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Frame.h"

namespace Tovicli::Cli {

/// `cli completion`: the script that teaches a shell to complete this tool's command lines.
class CompletionScript : public CliCommand {
public:
    explicit CompletionScript(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace Tovicli::Cli
