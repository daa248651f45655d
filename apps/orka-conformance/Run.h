// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iosfwd>

#include "Options.h"

namespace OrkaConformance {

/// Runs the cases that are chosen against the provider, on an event loop of its own, and writes the result. SIGINT and
/// SIGTERM end the run early, after what it made has been removed.
/// @throws UsageError for a URL, a bug or a pattern that names nothing
ExitStatus run(Options const &options, std::ostream &out, std::ostream &err);

/// What the program does when it is started as the process that is to be killed; the words follow --victim.
int runVictim(std::vector<std::string> const &words);

} // namespace OrkaConformance
