// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `daemon set`: adjusts the running daemon, or simulates an outage of a protocol endpoint.
class LUMO_COMMAND_EXPORT DaemonCommand : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<DaemonCommand> New();
    DaemonCommand();
    ~DaemonCommand() override;
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// @return the daemon's number for a keyword in any case; that of "error" for a word that it does not know.
    unsigned GetLogLevelInt(std::string keyword);
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
