// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

#include "ExitStatus.h"
#include "PluginSource.h"
#include "plexa/AutoCli.h"

namespace Tovicli {

/// What one call of a command came to.
struct Outcome {
    ExitStatus status = ExitStatus::Completed;
    /// What the command said, as it said it; for a failure that it said nothing about, our own words.
    std::string message;
    boost::shared_ptr<Plexa::MetaObj::MetaObject> result;
    std::optional<LastFailure> cause;
};

/// Executes the command and judges what it left. Never throws for what the command does.
Outcome call(Plexa::AutoCli::Command &command, boost::shared_ptr<Plexa::CallSpec::Input> const &input,
             PluginSource &plugins);

} // namespace Tovicli
