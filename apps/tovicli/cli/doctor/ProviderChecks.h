// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>

#include "doctor/DaemonChecks.h"
#include "doctor/Report.h"
#include "doctor/StoreView.h"

namespace Tovicli::Cli {

/// Each registered provider: its array's file where it has one, and whether the daemon serves anything through it; then
/// containers that are mounted and that nobody exports now, and endpoints in an outage.
/// @param served nothing: the daemon could not be asked
void checkProviders(StoreView const &view, std::optional<Served> const &served, Report &report);

} // namespace Tovicli::Cli
