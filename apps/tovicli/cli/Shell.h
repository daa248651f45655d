// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <optional>

#include "Frame.h"
#include "shell/LineSource.h"

namespace Tovicli::Cli {

/// `cli shell`: many command lines in one process, with one session of the plug-ins, typed or from standard input.
class Shell : public CliCommand {
public:
    explicit Shell(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;

private:
    std::unique_ptr<LineSource> terminalLines();
    ExitStatus converse(LineSource &lines);
    ExitStatus runAll(LineSource &lines, bool keepGoing);
    /// @return nothing for a line without words
    std::optional<ExitStatus> runLine(Line const &line, std::string const &where);

    bool ended_ = false; ///< by the word "exit"
};

} // namespace Tovicli::Cli
