// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// The whole of listing and synchronising consistency groups: reads the parameters, opens a session that stays with the
/// process, and answers with an empty list of structures that look like the schema.
void answerNoGroups(InputPtr const &input, OutputPtr const &output, StructPtr const &schema);

} // namespace TarselCli::LumoNamespace
