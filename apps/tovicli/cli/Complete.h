// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Frame.h"

namespace Tovicli::Cli {

/// `cli complete`: what the scripts of `cli completion` ask while a user types. Not shown anywhere, silent whatever
/// happens, done within a second also when the daemon is not well.
///
/// The first line of its output is what to complete with: "words", "files" or "directories"; each further line is a
/// value, a tab and a description. The words of the line are given by --word=, the last one being the one that is
/// completed, with the quotes that it was typed with.
class Complete : public CliCommand {
public:
    explicit Complete(CliServices &services);
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace Tovicli::Cli
