// SPDX-License-Identifier: Apache-2.0
//
// Texts that come from the daemon's client library, and the text of a failed daemon request.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// @return the text; empty for a null pointer.
std::string textOrEmpty(char const *text);

/// Writes the text. A null pointer ends the line there: the stream fails and what is written later is lost.
void writeText(std::ostream &stream, char const *text);

/// The standard text of a failed request: the prefix, the daemon's text for the code and a newline; the prefix alone
/// when the daemon has no text for the code.
/// @param prefix names the request and ends in a blank
std::string failureText(char const *prefix, int32_t code);

/// Leaves the outcome of a daemon request in the output: true as the result for code 0, the standard text as the
/// message for any other. Completing the output is left to the command.
/// @return whether the request succeeded.
bool reportOutcome(OutputPtr const &output, char const *prefix, int32_t code);

} // namespace TarselCli::LumoNamespace
