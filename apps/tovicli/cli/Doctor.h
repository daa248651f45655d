// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Frame.h"

namespace Tovicli::Cli {

/// `cli doctor`: looks over the host, one line a check. Changes nothing, also on a host that is half broken, and is
/// done in the time that a request to the daemon may take.
class Doctor : public CliCommand {
public:
    explicit Doctor(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace Tovicli::Cli
