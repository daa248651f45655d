// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Frame.h"

namespace Tovicli::Cli {

/// `cli describe`: what a command takes and what its result looks like, as one JSON document.
class Describe : public CliCommand {
public:
    explicit Describe(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace Tovicli::Cli
