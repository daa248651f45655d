// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Environment.h"
#include "plexa/CallSpec.h"

namespace Tovicli {

/// What holds for a run of the tool: from its options, behind them the environment, behind that the defaults.
struct Settings {
    std::optional<std::string> format; ///< empty: what the command names
    std::vector<std::string> formatParameters;
    std::optional<std::string> fields;
    std::string root;
    int64_t timeoutMs = 0;
    std::optional<std::string> logLevel; ///< lower case
    std::string pluginDirectory;
    std::optional<std::string> requestId; ///< empty: a fresh one
    bool version = false;
    bool help = false;

    /// Whether plug-ins that were loaded under the other settings would have to be registered afresh under these.
    bool servesSamePlugins(Settings const &other) const {
        return root == other.root && timeoutMs == other.timeoutMs && pluginDirectory == other.pluginDirectory;
    }
};

/// What the settings fall back to, and how relative paths are completed.
struct Defaults {
    std::string pluginDirectory;
    std::string workingDirectory;
};

/// The declaration of the global options; parser and help read it.
boost::shared_ptr<Plexa::CallSpec::InputSpec> globalOptions();

/// @param environment null in a privileged process: the caller chooses neither variables nor directories then
/// @throws Plexa::UsageError for a bad value of an option or a variable
Settings settingsFrom(Plexa::CallSpec::Input const &options, Environment const *environment, Defaults const &defaults);

} // namespace Tovicli
